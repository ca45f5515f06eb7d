// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Ports/ProcessInfo.h>

#include <sys/auxv.h>

#include <filesystem>

#include <Varnel/Platform/Linux/Adapters.h>
#include <Varnel/Platform/POSIX/Adapters.h>

namespace Varnel::Platform::Linux {
namespace {

namespace fs = std::filesystem;

// The kernel marks the name of a file that was removed or replaced (by an update, say) since the
// process began.
fs::path withoutMarkOfDeletion(const fs::path& path, const fs::path& link) {
  constexpr std::string_view mark = " (deleted)";
  std::string text = path.string();
  std::error_code failed;
  if (!text.ends_with(mark) || fs::equivalent(path, link, failed)) return path;
  text.resize(text.size() - mark.size());
  return text;
}

// Without /proc (in a bare sandbox, or early in a machine's start) there is still the name by which
// the program was called. Even if that leads nowhere from here, its last component is right.
fs::path pathThatWasCalled() {
  // The kernel hands the address over as a number. NOLINTNEXTLINE(performance-no-int-to-ptr)
  const auto* name = reinterpret_cast<const char*>(::getauxval(AT_EXECFN));
  if (!name) return {};
  std::error_code failed;
  const fs::path path = fs::canonical(name, failed);
  return failed ? fs::absolute(name, failed) : path;
}

fs::path findExecutable(const fs::path& root) {
  const fs::path link = root / "proc/self/exe";
  std::error_code failed;
  const fs::path path = fs::read_symlink(link, failed);
  return failed ? pathThatWasCalled() : withoutMarkOfDeletion(path, link);
}

}  // namespace

std::unique_ptr<ProcessInfo> makeProcessInfo(const std::string& root) {
  return POSIX::makeProcessInfo(findExecutable(root).string());
}

}  // namespace Varnel::Platform::Linux
