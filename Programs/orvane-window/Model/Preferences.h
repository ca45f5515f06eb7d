// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

#include <Scan/ScanRequest.h>
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

  /// Which files of the folders take part in a scan: no hidden ones, and of any size, unless the
  /// user has chosen otherwise.
  [[nodiscard]] static ScanRequest scanRequest();
  [[nodiscard]] static Failure setSkipsHidden(bool skipsHidden);
  [[nodiscard]] static Failure setMinSize(std::uint64_t bytes);

  /// The folders that were last scanned, byte for byte.
  [[nodiscard]] static std::vector<std::string> lastFolders();
  [[nodiscard]] static Failure setLastFolders(const std::vector<std::string>& folders);
};

}  // namespace Orvane
