// SPDX-License-Identifier: MIT
#include <fcntl.h>
#include <linux/fiemap.h>
#include <linux/fs.h>
#include <linux/openat2.h>
#include <sys/ioctl.h>
#include <sys/stat.h>
#include <sys/syscall.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <cstddef>
#include <cstring>
#include <string>

#include <Scan/SystemCalls.h>

namespace Orvane {

const int openToPassThrough = O_PATH | O_DIRECTORY;

// Kernels before 5.6 do not have the call.
int openWithoutLinksAtOnce(int folder, const char* path, int flags) {
  open_how how{};
  how.flags = static_cast<unsigned>(flags);
  how.resolve = RESOLVE_NO_SYMLINKS;
  return static_cast<int>(::syscall(SYS_openat2, folder, path, &how, sizeof how));
}

// The system makes the other program give the lease back. Only of a regular file is there nobody
// else to wait for.
int openLeased(int folder, const char* name) {
  const int found = ::openat(folder, name, O_PATH | O_NOFOLLOW | O_CLOEXEC);
  struct stat facts;
  const bool isFile = found >= 0 && ::fstat(found, &facts) == 0 && S_ISREG(facts.st_mode);
  const std::string path = "/proc/self/fd/" + std::to_string(found);
  const int opened = isFile ? ::open(path.c_str(), O_RDONLY | O_CLOEXEC) : -1;
  if (found >= 0) ::close(found);
  if (opened < 0) errno = EAGAIN;
  return opened;
}

std::optional<std::uint64_t> placeOf(int descriptor) {
  // Room for the head of the answer and the one extent that is asked for.
  alignas(fiemap) std::array<std::byte, sizeof(fiemap) + sizeof(fiemap_extent)> answer{};
  auto* const map = reinterpret_cast<fiemap*>(answer.data());
  map->fm_length = FIEMAP_MAX_OFFSET;
  map->fm_extent_count = 1;
  if (::ioctl(descriptor, FS_IOC_FIEMAP, map) != 0 || map->fm_mapped_extents == 0)
    return std::nullopt;
  fiemap_extent extent;
  std::memcpy(&extent, answer.data() + sizeof(fiemap), sizeof extent);
  if (extent.fe_flags & (FIEMAP_EXTENT_UNKNOWN | FIEMAP_EXTENT_DELALLOC)) return std::nullopt;
  return extent.fe_physical;
}

}  // namespace Orvane
