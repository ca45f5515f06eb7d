// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <string_view>

#include <Varnel/Logging/LoggingObject.h>
#include <Varnel/Platform/Api.h>
#include <Varnel/Tallyhouse/BaseAnalyticsSender.h>

namespace Varnel {

/// A sender whose events carry the suite's custom dimensions unless given others, and show in the
/// log while the tracker prints events.
///
///     CommonAnalyticsSender sender(tracker);
///     sender.trackCustomEvent("Scan", "Finished", "Pictures", 12);
///
/// Any thread. A first event may have to find the client identifier: see `CustomDimensionsHolder`.
class VARNEL_API CommonAnalyticsSender : public Tallyhouse::BaseAnalyticsSender,
                                         public LoggingObject {
 public:
  explicit CommonAnalyticsSender(std::shared_ptr<Tallyhouse::AnalyticsTracker> tracker);

  [[nodiscard]] std::string_view logAuthor() const override { return "CommonAnalyticsSender"; }

  /// Sends an event of any category. Empty dimensions stand for those of the holder; others go as
  /// they are.
  void trackCustomEvent(std::string_view category, std::string_view action,
                        const std::optional<std::string>& label, std::optional<std::int64_t> value,
                        const Tallyhouse::CustomDimensions& customDimensions,
                        const Tallyhouse::CustomMetrics& customMetrics);
  void trackCustomEvent(std::string_view category, std::string_view action,
                        const std::string& label, std::int64_t value);

  using BaseAnalyticsSender::trackEvent;
  /// The same in the sender's own category.
  void trackEvent(std::string_view action, const std::optional<std::string>& label,
                  std::optional<std::int64_t> value,
                  const Tallyhouse::CustomDimensions& customDimensions,
                  const Tallyhouse::CustomMetrics& customMetrics) override;
};

}  // namespace Varnel
