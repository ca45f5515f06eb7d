// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <functional>
#include <memory>
#include <optional>
#include <stop_token>
#include <string>
#include <vector>

#include <Varnel/Platform/Values/Date.h>
#include <Varnel/Tallyhouse/DeliveryPolicy.h>
#include <Varnel/Tallyhouse/EventSpool.h>

namespace Varnel::Platform {
class Clock;
class HTTPClient;
}  // namespace Varnel::Platform

namespace Tallyhouse {

/// Where batches go.
struct Endpoint final {
  std::string url;
  bool allowsPlainHTTP = false;
};

/// Carries events from the spool to the server, one batch for each step. It has no thread of its
/// own: its caller calls `step` again at the time that `step` returns.
///
/// Of all processes that share the spool one delivers: whoever finds something due takes the lock
/// beside the spool, sends until nothing more is due, and frees it. When it dies, the system frees
/// it, and the next process that looks takes over. The pauses that the server causes are in the
/// spool, and hold for all.
///
/// One thread at a time.
class Delivery final {
 public:
  struct Ports {
    Varnel::Platform::Clock& clock;
    Varnel::Platform::HTTPClient& httpClient;
  };
  enum class Haste {
    usual,  ///< Events wait a little for others to join their batch.
    none,   ///< Waiting events are sent at once, unless the server has asked for a pause.
  };
  enum class State {
    idle,       ///< There is nothing to send.
    due,        ///< There is more to send now.
    later,      ///< Events linger, or the server is left alone.
    elsewhere,  ///< Another process delivers.
    fileAway    ///< The spool cannot be had.
  };
  struct Step {
    State state = State::idle;
    std::optional<Varnel::Platform::Date> next;  ///< Absent when idle.
    std::int64_t waiting = 0;                    ///< Events in line, counted up to a full batch.
  };

  /// `random` gives numbers from 0 to 1.
  Delivery(Ports ports, EventSpool& spool, Endpoint endpoint, DeliveryPolicy policy,
           std::function<double()> random);

  /// Sends a batch if one is due and waits for the answer. After `stop` nothing more is sent.
  [[nodiscard]] Step step(Haste haste, const std::stop_token& stop);

  /// Lets others deliver, and forgets what it has not noted: the spool is being emptied.
  void rest();

  /// Notes at last what could not be noted yet; others may deliver from then on.
  void finish();

 private:
  [[nodiscard]] std::optional<Varnel::Platform::Date> nextSending(const SpoolOutlook& outlook,
                                                                  Haste haste) const;
  [[nodiscard]] bool saveOutcome();
  [[nodiscard]] Step fileIsAway();
  void send(std::vector<SpooledEvent> events, const DeliveryState& before,
            const std::stop_token& stop);

  const Ports ports_;
  EventSpool& spool_;
  const Endpoint endpoint_;
  const DeliveryPolicy policy_;
  const std::function<double()> random_;
  std::unique_ptr<Varnel::Platform::FileLock> election_;  ///< Held by the one deliverer.
  /// Not in the spool yet. Until it is, nothing more is sent: a batch is not sent again because it
  /// cannot be noted.
  std::optional<DeliveryOutcome> outcome_;
  Varnel::Platform::GrowingPause filePause_ = spoolPause;
};

}  // namespace Tallyhouse
