// SPDX-License-Identifier: MIT
#include <filesystem>

#include <Varnel/Platform/Generic/SQLiteCookieStorage.h>
#include <Varnel/Platform/POSIX/Adapters.h>
#include <Varnel/Platform/POSIX/UserFolders.h>
#include <Varnel/Platform/Ports/ProcessInfo.h>

namespace Varnel::Platform::POSIX {

// A program keeps its cookies under the name of its executable.
std::unique_ptr<CookieStorage> makeCookieStorage(const ProcessInfo& process, const Clock& clock) {
  const std::filesystem::path executable = process.executablePath();
  return std::make_unique<SQLiteCookieStorage>(userDataFolder(), executable.filename().string(),
                                               clock);
}

}  // namespace Varnel::Platform::POSIX
