// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Linux/Process/UserFolders.h>

#include <cstdlib>

#include <Varnel/Platform/Linux/Adapters.h>
#include <Varnel/Platform/POSIX/Adapters.h>
#include <Varnel/Platform/Ports/ProcessInfo.h>
#include <Varnel/Platform/Ports/UserAccount.h>

namespace Varnel::Platform::Linux {
namespace {

namespace fs = std::filesystem;

fs::path folder(const char* variable, const char* belowHome) {
  const char* value = std::getenv(variable);
  if (value && *value == '/') return value;
  return fs::path(POSIX::makeUserAccount()->homeFolder()) / belowHome;
}

}  // namespace

fs::path userDataFolder() {
  return folder("XDG_DATA_HOME", ".local/share");
}

fs::path userConfigurationFolder() {
  return folder("XDG_CONFIG_HOME", ".config");
}

fs::path userStateFolder() {
  return folder("XDG_STATE_HOME", ".local/state");
}

std::string applicationFolderName() {
  static const auto& executable = *new fs::path(makeProcessInfo()->executablePath());
  return executable.filename().string();
}

}  // namespace Varnel::Platform::Linux
