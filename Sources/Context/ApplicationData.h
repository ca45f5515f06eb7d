// SPDX-License-Identifier: MIT
#pragma once

#include <string>

#include <Varnel/Platform/Api.h>

namespace Varnel::Platform {
class UserDefaults;
}

namespace Varnel {

/// What this application keeps in the user's folders from run to run, under
/// `Globals::baseIdentifier()`. All programs of a product share it.
///
///     if (ApplicationData::settings().truthValue("animations").value_or(true)) animate();
///     SpoolingTransport::make({…, .spoolPath = ApplicationData::analyticsSpoolPath()});
///
/// Any thread.
class VARNEL_API ApplicationData final {
 public:
  ApplicationData() = delete;

  /// Lives as long as the process.
  [[nodiscard]] static Platform::UserDefaults& settings();

  /// The file with the settings. Beside it may lie others whose names begin with its own.
  [[nodiscard]] static std::string settingsPath();

  /// The file where the events of all the product's processes wait to be sent.
  [[nodiscard]] static std::string analyticsSpoolPath();

  /// The folder with the log of each day, named by it: "2026-03-14.log".
  [[nodiscard]] static std::string logFolder();
};

}  // namespace Varnel
