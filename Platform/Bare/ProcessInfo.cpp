// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Ports/ProcessInfo.h>

#include <filesystem>
#include <system_error>

#include <Varnel/Platform/Bare/Adapters.h>
#include <Varnel/Platform/POSIX/Adapters.h>

namespace Varnel::Platform::Bare {

// POSIX has no way to the running program, but several systems have the one or the other link.
std::unique_ptr<ProcessInfo> makeProcessInfo() {
  for (const char* link : {"/proc/self/exe", "/proc/curproc/file", "/proc/self/path/a.out"}) {
    std::error_code failed;
    const auto executable = std::filesystem::read_symlink(link, failed);
    if (!failed) return POSIX::makeProcessInfo(executable.string());
  }
  return POSIX::makeProcessInfo({});
}

}  // namespace Varnel::Platform::Bare
