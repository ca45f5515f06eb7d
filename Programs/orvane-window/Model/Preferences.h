// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <string>
#include <vector>

#include <Varnel/Platform/Values/PlatformError.h>

namespace Orvane {

/// What the window keeps from run to run, in the product's settings. The period of the reminder and
/// the consent are there too: see `Reminders.h` and `AnalyticsConsent.h`. Main thread.
class Preferences final {
 public:
  using Failure = std::optional<Varnel::Platform::PlatformError>;

  Preferences() = delete;

  /// No until the user has chosen sounds.
  [[nodiscard]] static bool playsSounds();
  [[nodiscard]] static Failure setPlaysSounds(bool playsSounds);

  /// The folders that were last scanned, byte for byte.
  [[nodiscard]] static std::vector<std::string> lastFolders();
  [[nodiscard]] static Failure setLastFolders(const std::vector<std::string>& folders);
};

}  // namespace Orvane
