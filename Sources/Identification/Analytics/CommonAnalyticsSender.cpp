// SPDX-License-Identifier: MIT
#include <Varnel/Identification/Analytics/CommonAnalyticsSender.h>

#include <utility>

#include <Varnel/Identification/Analytics/AnalyticsEcho.h>
#include <Varnel/Identification/Analytics/CustomDimensionsHolder.h>

namespace Varnel {

using Tallyhouse::CustomDimensions;
using Tallyhouse::CustomMetrics;

CommonAnalyticsSender::CommonAnalyticsSender(std::shared_ptr<Tallyhouse::AnalyticsTracker> tracker)
    : BaseAnalyticsSender(std::move(tracker)) {}

void CommonAnalyticsSender::trackCustomEvent(std::string_view category, std::string_view action,
                                             const std::optional<std::string>& label,
                                             std::optional<std::int64_t> value,
                                             const CustomDimensions& customDimensions,
                                             const CustomMetrics& customMetrics) {
  const CustomDimensions dimensions =
      customDimensions.empty() ? CustomDimensionsHolder::customDimensions() : customDimensions;
  context().trackEvent(category, action, label, value, dimensions, customMetrics);
  if (tracker()->shouldPrintEvents())
    log(analyticsEcho(category, action, label, value, dimensions));
}

void CommonAnalyticsSender::trackCustomEvent(std::string_view category, std::string_view action,
                                             const std::string& label, std::int64_t value) {
  trackCustomEvent(category, action, label, value, {}, {});
}

void CommonAnalyticsSender::trackEvent(std::string_view action,
                                       const std::optional<std::string>& label,
                                       std::optional<std::int64_t> value,
                                       const CustomDimensions& customDimensions,
                                       const CustomMetrics& customMetrics) {
  trackCustomEvent(categoryName(), action, label, value, customDimensions, customMetrics);
}

}  // namespace Varnel
