// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Linux/Disks/MountID.h>

#include <fcntl.h>
#include <sys/stat.h>

#include <cerrno>
#include <charconv>
#include <string_view>
#include <system_error>

#include <Varnel/Platform/Linux/Disks/KernelFolder.h>
#include <Varnel/Platform/POSIX/FileDescriptor.h>

namespace Varnel::Platform::Linux {
namespace {

PlatformError systemError(int number) {
  return PlatformError(std::error_code(number, std::generic_category()));
}

std::optional<int> told(int descriptor, const char* path, int flags) {
  struct statx facts {};
  if (::statx(descriptor, path, flags | AT_NO_AUTOMOUNT | AT_STATX_DONT_SYNC, STATX_MNT_ID,
              &facts) != 0 ||
      (facts.stx_mask & STATX_MNT_ID) == 0)
    return std::nullopt;
  return static_cast<int>(facts.stx_mnt_id);
}

}  // namespace

Result<int> mountIDOf(const std::string& path) {
  // The system would look up only the part before the zero.
  if (path.find('\0') != std::string::npos) return systemError(EINVAL);
  if (const auto id = told(AT_FDCWD, path.c_str(), AT_SYMLINK_NOFOLLOW)) return *id;
  // Opening it this way touches no more than a look-up does, and fails like one.
  const POSIX::FileDescriptor file(::open(path.c_str(), O_PATH | O_NOFOLLOW | O_CLOEXEC));
  if (!file) return systemError(errno);
  return mountIDOf(file.get());
}

// Kernels before 5.8 tell it in a table.
Result<int> mountIDOf(int descriptor) {
  if (const auto id = told(descriptor, "", AT_EMPTY_PATH)) return *id;
  constexpr std::string_view key = "mnt_id:\t";
  const std::string facts =
      KernelFolder("/proc/self/fdinfo").bytes(std::to_string(descriptor)).value_or(std::string());
  const std::size_t found = facts.find(key);
  if (found == std::string::npos) return systemError(ENOTSUP);
  int id = 0;
  const char* const number = facts.data() + found + key.size();
  if (std::from_chars(number, facts.data() + facts.size(), id).ec != std::errc())
    return systemError(ENOTSUP);
  return id;
}

}  // namespace Varnel::Platform::Linux
