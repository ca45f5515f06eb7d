// SPDX-License-Identifier: MIT
#include <Varnel/Platform/POSIX/UserFolders.h>

#include <cstdlib>
#include <system_error>

#include <Varnel/Platform/POSIX/Adapters.h>
#include <Varnel/Platform/Ports/UserAccount.h>
#include <Varnel/Platform/Values/PathComponents.h>

namespace Varnel::Platform::POSIX {
namespace {

namespace fs = std::filesystem;

fs::path folder(const char* variable, const char* belowHome) {
  const char* value = std::getenv(variable);
  if (value && *value == '/') return value;
  return fs::path(makeUserAccount()->homeFolder()) / belowHome;
}

fs::path stateFolder(const std::string& identifier) {
  return stateFolders() / fileNameFor(identifier);
}

}  // namespace

fs::path stateFolders() {
  return folder("XDG_STATE_HOME", ".local/state");
}

fs::path settingsFolder(const std::string& identifier) {
  return folder("XDG_CONFIG_HOME", ".config") / fileNameFor(identifier);
}

fs::path notificationStore(const std::string& identifier) {
  return notificationStoreIn(stateFolder(identifier));
}

fs::path notificationStoreIn(const fs::path& folder) {
  return folder / "notifications.sqlite";
}

std::vector<fs::path> notificationStores() {
  std::vector<fs::path> stores;
  std::error_code error;
  for (fs::directory_iterator each(stateFolders(), error), end; !error && each != end;
       each.increment(error))
    if (std::error_code unreadable; fs::exists(notificationStoreIn(*each), unreadable))
      stores.push_back(notificationStoreIn(*each));
  return stores;
}

fs::path analyticsSpool(const std::string& identifier) {
  return stateFolder(identifier) / "analytics.sqlite";
}

fs::path userDataFolder() {
  return folder("XDG_DATA_HOME", ".local/share");
}

}  // namespace Varnel::Platform::POSIX
