// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <memory>
#include <mutex>
#include <optional>
#include <string_view>

#include <Varnel/Platform/Api.h>
#include <Varnel/Platform/Values/UUID.h>
#include <Varnel/Tallyhouse/AnalyticsEvent.h>

namespace Varnel::Platform {
class Clock;
struct Ports;
}  // namespace Varnel::Platform

namespace Tallyhouse {

class AnalyticsTransport;

/// Whether the user agreed to be counted. Only `granted` lets an event be kept or sent.
enum class Consent { notAsked, refused, granted };

/// Makes events and hands them to a transport, as long as the user consents.
///
/// Without consent nothing is kept, neither in memory nor in a file, and nothing is sent: an event
/// of that time is gone. Events that earlier runs left, by consent, wait untouched until this
/// context is told one way or the other.
///
/// Any thread. No operation throws or waits for the network. An event that cannot be kept is
/// silently lost.
class VARNEL_API AnalyticsContext final {
 public:
  struct Ports {
    Varnel::Platform::Clock& clock;
  };

  /// Without a transport, events go nowhere.
  AnalyticsContext(Ports ports, std::shared_ptr<AnalyticsTransport> transport,
                   Consent consent = Consent::notAsked);
  AnalyticsContext(const Varnel::Platform::Ports& ports,
                   std::shared_ptr<AnalyticsTransport> transport,
                   Consent consent = Consent::notAsked);
  explicit AnalyticsContext(std::shared_ptr<AnalyticsTransport> transport,
                            Consent consent = Consent::notAsked);
  AnalyticsContext(const AnalyticsContext&) = delete;
  AnalyticsContext& operator=(const AnalyticsContext&) = delete;

  /// Sends one event, given consent.
  void trackEvent(std::string_view category, std::string_view action,
                  const std::optional<std::string>& label, std::optional<std::int64_t> value,
                  const CustomDimensions& customDimensions, const CustomMetrics& customMetrics,
                  bool isTest = false) noexcept;

  [[nodiscard]] Consent consent() const noexcept;
  /// Anything but `granted` stops the collection and throws away all events that have not been
  /// delivered, those of earlier runs included.
  void setConsent(Consent consent) noexcept;

 private:
  void tellTransport() noexcept;

  const Ports ports_;
  const std::shared_ptr<AnalyticsTransport> transport_;
  mutable std::mutex mutex_;  ///< Owns all below, and the transport's calls.
  Consent consent_;
  Varnel::Platform::UUIDGenerator uuids_;
};

}  // namespace Tallyhouse
