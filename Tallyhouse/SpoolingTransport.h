// SPDX-License-Identifier: MIT
#pragma once

#include <chrono>
#include <cstdint>
#include <memory>
#include <optional>
#include <string>

#include <Varnel/Platform/Api.h>
#include <Varnel/Platform/Values/URL.h>
#include <Varnel/Tallyhouse/AnalyticsTransport.h>
#include <Varnel/Tallyhouse/DeliveryPolicy.h>
#include <Varnel/Tallyhouse/SpoolCounts.h>

namespace Varnel::Platform {
class Clock;
class HTTPClient;
class PrivateFiles;
class SystemLog;
struct Ports;
}  // namespace Varnel::Platform

namespace Tallyhouse {

/// Posts events to a server, by way of a file: an event that was accepted survives the end of the
/// process and weeks without a network, though not always a loss of power. A thread of its own
/// sends batches and deletes what the server has taken; an event that gets lost on the way is sent
/// again under the same UUID.
///
///     auto transport = SpoolingTransport::make({
///         .endpoint = *URL::parse("https://collect.quennel.example/batch"),
///         .trackingID = "QN-1", .clientID = id, .spoolPath = path});
///     auto tracker = std::make_shared<AnalyticsTracker>(std::move(transport), consent);
///
/// `accept` costs the insertion of a row and never waits for the network, nor for more than 20 ms
/// for another process that has the file locked: events that the file does not take now are held in
/// memory, as far as that is sensible, and written later; `counts().held` tells whether there are
/// any. Destruction interrupts a transfer, which the next run repeats; call `drain` before it where
/// a process is short-lived. A forked child records and sends nothing with its parent's transport.
///
/// Processes may share a spool; one of them delivers at a time. When one of them refuses consent,
/// the others' events are thrown away as well, and they take none until their next `start`.
class VARNEL_API SpoolingTransport final : public AnalyticsTransport {
 public:
  struct Ports {
    Varnel::Platform::Clock& clock;
    Varnel::Platform::HTTPClient& httpClient;
    Varnel::Platform::PrivateFiles& privateFiles;
    Varnel::Platform::SystemLog& systemLog;
  };
  enum class PlainHTTP { refused, allowed };

  struct Configuration {
    Varnel::Platform::URL endpoint;
    std::string trackingID;  ///< The property that counts the events.
    std::string clientID;    ///< The installation that sends them.
    std::string spoolPath;   ///< The user's alone. Missing folders are made.
    PlainHTTP plainHTTP = PlainHTTP::refused;
    std::int64_t maxEvents = 10'000;  ///< How many may wait; then the oldest are dropped.
    std::int64_t maxBytes = 8 << 20;  ///< Of the file, without what is free in it.
    DeliveryPolicy policy = {};
  };

  /// None when the endpoint is no https URL (or http, where that is allowed).
  [[nodiscard]] static std::unique_ptr<SpoolingTransport> make(Ports ports,
                                                               Configuration configuration);
  [[nodiscard]] static std::unique_ptr<SpoolingTransport> make(const Varnel::Platform::Ports& ports,
                                                               Configuration configuration);
  [[nodiscard]] static std::unique_ptr<SpoolingTransport> make(Configuration configuration);
  ~SpoolingTransport() override;
  SpoolingTransport(const SpoolingTransport&) = delete;
  SpoolingTransport& operator=(const SpoolingTransport&) = delete;

  void start() noexcept override;
  void accept(const AnalyticsEvent& event) noexcept override;
  void discardAll() noexcept override;

  /// Sends the waiting events without lingering, and waits until none is left, the server has to be
  /// left alone, or the time is over; while another process delivers or has the file locked, until
  /// the events of this one are gone.
  /// Returns whether all that this process recorded was delivered, by whomever; false without
  /// consent.
  bool drain(std::chrono::milliseconds timeout);

  /// Whether all that `discardAll` threw away is gone from the file. Where the file cannot be had
  /// it is not, and the next `discardAll` tries again.
  [[nodiscard]] bool hasDiscardedAll() const;

  /// What waits and what was dropped. Makes no file; counts nothing in one that cannot be read.
  [[nodiscard]] SpoolCounts counts() const;

 private:
  struct Parts;
  explicit SpoolingTransport(std::unique_ptr<Parts> parts);

  std::unique_ptr<Parts> parts_;  ///< Never null.
};

}  // namespace Tallyhouse
