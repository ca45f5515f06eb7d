// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <optional>
#include <string>

#include <Varnel/Platform/Api.h>
#include <Varnel/Tallyhouse/AnalyticsEvent.h>

namespace Varnel {

/// The process's values behind the custom dimensions of every event. The host keeps the counts up
/// to date:
///
///     CustomDimensionsHolder::setLaunchCount(settings.launches());
///
/// Identifier and download source are found when they are first read, unless they were set before.
/// Finding them reads files and may wait for a program; meanwhile the other values can be read, and
/// all values can be set. Any thread.
class VARNEL_API CustomDimensionsHolder final {
 public:
  CustomDimensionsHolder() = delete;

  /// At first that of `UserIdentificationInfo`.
  [[nodiscard]] static std::string clientIdentifier();
  static void setClientIdentifier(std::string identifier);

  /// Where the application was downloaded from.
  [[nodiscard]] static std::optional<std::string> downloadSourceURL();
  static void setDownloadSourceURL(std::optional<std::string> url);

  /// From 0 to 1.
  [[nodiscard]] static double achievementsFractionCompleted();
  static void setAchievementsFractionCompleted(double fraction);

  [[nodiscard]] static std::int64_t scanCount();
  static void setScanCount(std::int64_t count);
  [[nodiscard]] static std::int64_t cleanCount();
  static void setCleanCount(std::int64_t count);
  [[nodiscard]] static std::int64_t launchCount();
  static void setLaunchCount(std::int64_t count);

  /// A "1" or "0" for each of seven sibling products, installed or not when first asked.
  [[nodiscard]] static const std::string& otherAppsAvailabilityString();

  /// Dimensions 1 to 8, made afresh of the present values.
  [[nodiscard]] static Tallyhouse::CustomDimensions customDimensions();
};

}  // namespace Varnel
