// SPDX-License-Identifier: MIT
#include <Varnel/Context/ApplicationData.h>

#include <Varnel/Context/Globals.h>
#include <Varnel/Platform/Ports/ApplicationStorage.h>
#include <Varnel/Platform/Ports/Ports.h>

namespace Varnel {

Platform::UserDefaults& ApplicationData::settings() {
  return Platform::processPorts().applicationStorage.get().userDefaults(Globals::baseIdentifier());
}

std::string ApplicationData::analyticsSpoolPath() {
  return Platform::processPorts().applicationStorage.get().analyticsSpoolPath(
      Globals::baseIdentifier());
}

}  // namespace Varnel
