// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <optional>
#include <string>

#include <Varnel/Platform/Api.h>
#include <Varnel/Tallyhouse/AnalyticsEvent.h>

namespace Varnel {

/// The values behind the suite's custom dimensions. A plain value.
struct VARNEL_API CustomDimensionValues final {
  std::string clientIdentifier;
  std::optional<std::string> downloadSourceURL;
  double achievementsFractionCompleted = 0;  ///< From 0 to 1.
  std::int64_t scanCount = 0;
  std::int64_t cleanCount = 0;
  std::int64_t launchCount = 0;
  std::string otherAppsAvailabilityString;

  /// Dimensions 1 to 8. The second is unused; a missing download source is the text "null".
  [[nodiscard]] Tallyhouse::CustomDimensions customDimensions() const;
};

}  // namespace Varnel
