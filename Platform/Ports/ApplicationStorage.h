// SPDX-License-Identifier: MIT
#pragma once

#include <string>

#include <Varnel/Platform/Api.h>

namespace Varnel::Platform {

class UserDefaults;

/// What applications keep in this user's folders from run to run, each under its base identifier.
/// Processes that name one identifier share what is kept under it. Any thread.
///
/// An identifier never leads out of the user's folders. Those that are no file's name (empty, "..",
/// with a slash) may share what is kept under them.
///
///     storage.userDefaults("com.example.Fotovia").integer("scans").value_or(0);
class VARNEL_API ApplicationStorage {
 public:
  virtual ~ApplicationStorage() = default;
  ApplicationStorage& operator=(const ApplicationStorage&) = delete;

  /// The settings of an application: the same object for the same identifier, as long-lived as
  /// this one.
  [[nodiscard]] virtual UserDefaults& userDefaults(const std::string& identifier) = 0;

  /// The absolute path of the file with the settings. Beside it may lie others whose names begin
  /// with its own. Neither the file nor its folder need exist.
  [[nodiscard]] virtual std::string settingsPath(const std::string& identifier) const = 0;

  /// The absolute path of the file where an application's analytics events wait. Neither the file
  /// nor its folder need exist.
  [[nodiscard]] virtual std::string analyticsSpoolPath(const std::string& identifier) const = 0;
};

}  // namespace Varnel::Platform
