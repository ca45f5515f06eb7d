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
}  // namespace Varnel::Platform

namespace Tallyhouse {

class AnalyticsTransport;

/// Whether the user agreed to be counted.
enum class Consent { granted, refused };

/// Makes events and hands them to a transport, as long as the user consents.
///
/// Any thread. No operation throws or waits for the network. An event that cannot be kept is
/// silently lost.
class VARNEL_API AnalyticsContext final {
 public:
  struct Ports {
    Varnel::Platform::Clock& clock;
  };

  /// Without a transport, events go nowhere.
  AnalyticsContext(Ports ports, std::shared_ptr<AnalyticsTransport> transport, Consent consent);
  AnalyticsContext(std::shared_ptr<AnalyticsTransport> transport, Consent consent);
  AnalyticsContext(const AnalyticsContext&) = delete;
  AnalyticsContext& operator=(const AnalyticsContext&) = delete;

  /// Sends one event.
  void trackEvent(std::string_view category, std::string_view action,
                  const std::optional<std::string>& label, std::optional<std::int64_t> value,
                  const CustomDimensions& customDimensions, const CustomMetrics& customMetrics,
                  bool isTest = false) noexcept;

  [[nodiscard]] Consent consent() const noexcept;
  /// Refusing stops the collection and throws away all events that have not been delivered.
  void setConsent(Consent consent) noexcept;

 private:
  void applyConsent() noexcept;

  const Ports ports_;
  const std::shared_ptr<AnalyticsTransport> transport_;
  mutable std::mutex mutex_;  ///< Owns all below, and the transport's calls.
  Consent consent_;
  Varnel::Platform::UUIDGenerator uuids_;
};

}  // namespace Tallyhouse
