// SPDX-License-Identifier: MIT
#include <Varnel/Context/ApplicationData.h>

#include <Varnel/Context/Globals.h>
#include <Varnel/Platform/Ports/ApplicationStorage.h>
#include <Varnel/Platform/Ports/Ports.h>
#include <Varnel/Platform/Ports/UserAccount.h>

namespace Varnel {

Platform::UserDefaults& ApplicationData::settings() {
  return Platform::processPorts().applicationStorage.get().userDefaults(Globals::baseIdentifier());
}

std::string ApplicationData::settingsPath() {
  return Platform::processPorts().applicationStorage.get().settingsPath(Globals::baseIdentifier());
}

std::string ApplicationData::analyticsSpoolPath() {
  return Platform::processPorts().applicationStorage.get().analyticsSpoolPath(
      Globals::baseIdentifier());
}

std::string ApplicationData::logFolder() {
  return Platform::processPorts().userAccount.get().homeFolder() + "/Library/Logs/" +
         Globals::baseIdentifier();
}

}  // namespace Varnel
