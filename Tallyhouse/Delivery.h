// SPDX-License-Identifier: MIT
#pragma once

#include <chrono>
#include <functional>
#include <optional>
#include <span>
#include <stop_token>
#include <string>

#include <Varnel/Platform/Values/Date.h>
#include <Varnel/Tallyhouse/DeliveryPolicy.h>

namespace Varnel::Platform {
class Clock;
class HTTPClient;
}  // namespace Varnel::Platform

namespace Tallyhouse {

class EventSpool;
struct SpooledEvent;

/// Where batches go.
struct Endpoint final {
  std::string url;
  bool allowsPlainHTTP = false;
};

/// Carries events from the spool to the server, one batch for each step. It has no thread of its
/// own: its caller calls `step` again at the time that `step` returns.
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

  /// `random` gives numbers from 0 to 1.
  Delivery(Ports ports, EventSpool& spool, Endpoint endpoint, DeliveryPolicy policy,
           std::function<double()> random);

  /// Sends a batch if one is due and waits for the answer. Returns when to call again; absent while
  /// there is nothing to send. After `stop` nothing more is sent.
  [[nodiscard]] std::optional<Varnel::Platform::Date> step(Haste haste, std::stop_token stop);

  /// How many attempts in a row have failed.
  [[nodiscard]] int failures() const { return failures_; }

 private:
  void send(std::span<const SpooledEvent> events, bool areRefused, std::stop_token stop);
  void backOff(std::optional<std::chrono::seconds> retryAfter);

  const Ports ports_;
  EventSpool& spool_;
  const Endpoint endpoint_;
  const DeliveryPolicy policy_;
  const std::function<double()> random_;
  int failures_ = 0;
  std::optional<Varnel::Platform::Date> notBefore_;
};

}  // namespace Tallyhouse
