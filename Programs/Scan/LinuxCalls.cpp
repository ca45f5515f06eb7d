// SPDX-License-Identifier: MIT
#include <fcntl.h>
#include <linux/btrfs.h>
#include <linux/fiemap.h>
#include <linux/fs.h>
#include <linux/magic.h>
#include <linux/openat2.h>
#include <sys/ioctl.h>
#include <sys/stat.h>
#include <sys/syscall.h>
#include <sys/vfs.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <cstddef>
#include <cstring>
#include <span>
#include <string>

#include <Scan/SystemCalls.h>

namespace Orvane {
namespace {

// Not every release of the headers names them.
constexpr std::uint32_t xfsMagic = 0x5846'5342;
constexpr std::uint32_t bcachefsMagic = 0xca45'1a4e;
constexpr std::uint32_t exfatMagic = 0x2011'bab0;
constexpr std::uint32_t fuseMagic = 0x6573'5546;
constexpr std::uint32_t cifsMagic = 0xff53'4d42;
constexpr std::uint32_t smb2Magic = 0xfe53'4d42;

/// A file in more pieces than fit into these is not looked at to its end.
constexpr unsigned maxMaps = 4096;

/// The system's list of some of a file's extents, from a place on.
template <std::uint32_t maxCount>
class ExtentMap final {
 public:
  explicit ExtentMap(std::uint64_t begin) {
    fiemap head;  // Braces would list its array of no length, which is no standard C++.
    std::memset(&head, 0, sizeof head);
    head.fm_start = begin;
    head.fm_length = FIEMAP_MAX_OFFSET - begin;
    head.fm_extent_count = maxCount;
    std::memcpy(answer_.data(), &head, sizeof head);
  }

  /// Valid as long as the object; nothing when the system does not tell.
  std::optional<std::span<const fiemap_extent>> ask(int descriptor) {
    if (::ioctl(descriptor, FS_IOC_FIEMAP, answer_.data()) != 0) return std::nullopt;
    fiemap head;
    std::memcpy(&head, answer_.data(), sizeof head);
    std::memcpy(extents_.data(), answer_.data() + sizeof head, sizeof extents_);
    return std::span<const fiemap_extent>(extents_).first(head.fm_mapped_extents);
  }

 private:
  std::array<fiemap_extent, maxCount> extents_{};
  alignas(fiemap) std::array<std::byte, sizeof(fiemap) + sizeof extents_> answer_{};
};

/// Extents that follow one another on the volume as they do in the file. How many they are is
/// chance.
struct Run {
  std::uint64_t logical = 0;
  std::uint64_t physical = 0;
  std::uint64_t length = 0;

  [[nodiscard]] bool isFollowedBy(const Run& next) const {
    return physical > 0 && next.logical == logical + length && next.physical == physical + length;
  }
};

std::uint64_t mixed(std::uint64_t sum, std::uint64_t fact) {
  sum = (sum ^ fact) * 0x9E37'79B9'7F4A'7C15;
  return sum ^ sum >> 32;
}

std::uint64_t mixed(std::uint64_t sum, const Run& run) {
  for (const std::uint64_t fact : {run.logical, run.physical, run.length}) sum = mixed(sum, fact);
  return sum;
}

/// A number for the volume. The subvolumes of one have devices of their own, and share extents.
std::optional<std::uint64_t> volumeOf(int descriptor) {
  btrfs_ioctl_fs_info_args volume{};
  if (::ioctl(descriptor, BTRFS_IOC_FS_INFO, &volume) == 0) {
    std::array<std::uint64_t, 2> identifier;
    std::memcpy(identifier.data(), volume.fsid, sizeof identifier);
    return mixed(identifier[0], identifier[1]);
  }
  struct stat facts;
  if (::fstat(descriptor, &facts) != 0) return std::nullopt;
  return facts.st_dev;
}

}  // namespace

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

bool isInMemory(int folder) {
  struct statfs facts;
  return ::fstatfs(folder, &facts) == 0 &&
         (facts.f_type == TMPFS_MAGIC || facts.f_type == RAMFS_MAGIC);
}

bool keepsNumbers(int folder) {
  struct statfs facts;
  if (::fstatfs(folder, &facts) != 0) return true;
  const auto type = static_cast<std::uint32_t>(facts.f_type);
  return type != MSDOS_SUPER_MAGIC && type != exfatMagic && type != fuseMagic &&
         type != cifsMagic && type != smb2Magic;
}

bool tellsSharedExtents(int folder) {
  struct statfs facts;
  if (::fstatfs(folder, &facts) != 0) return false;
  const auto type = static_cast<std::uint32_t>(facts.f_type);
  return type == BTRFS_SUPER_MAGIC || type == xfsMagic || type == bcachefsMagic;
}

std::optional<SharedExtents> sharedExtentsOf(int descriptor) {
  const auto volume = volumeOf(descriptor);
  struct stat facts;
  if (!volume || ::fstat(descriptor, &facts) != 0) return std::nullopt;
  const auto size = static_cast<std::uint64_t>(facts.st_size);
  SharedExtents found{.place = *volume};
  Run run;
  std::uint64_t begin = 0;
  unsigned maps = 0;
  // What is set aside behind the end, for a file that might grow, is of no account.
  for (bool isLast = size == 0; !isLast;) {
    ExtentMap<64> map(begin);
    const auto extents = map.ask(descriptor);
    if (!extents || ++maps > maxMaps) return std::nullopt;
    isLast = extents->empty();
    for (const fiemap_extent& extent : *extents) {
      begin = extent.fe_logical + extent.fe_length;
      isLast = begin >= size || (extent.fe_flags & FIEMAP_EXTENT_LAST) != 0;
      if (extent.fe_logical >= size) break;
      const Run next{.logical = extent.fe_logical,
                     .physical = extent.fe_physical,
                     .length = std::min(begin, size) - extent.fe_logical};
      if (extent.fe_flags & FIEMAP_EXTENT_SHARED) found.bytes += next.length;
      if (extent.fe_flags & FIEMAP_EXTENT_DATA_INLINE) found.inlineBytes += next.length;
      if (run.isFollowedBy(next)) {
        run.length += next.length;
        continue;
      }
      found.place = mixed(found.place, run);
      run = next;
    }
  }
  found.place = mixed(found.place, run);
  return found;
}

// Both may be open for reading alone: the system asks whether the user may write to the file.
FileResult<std::optional<std::uint64_t>> shareRange(int source, int file, std::uint64_t offset,
                                                    std::uint64_t length) {
  file_dedupe_range head;
  std::memset(&head, 0, sizeof head);
  head.src_offset = offset;
  head.src_length = length;
  head.dest_count = 1;
  file_dedupe_range_info part{};
  part.dest_fd = file;
  part.dest_offset = offset;
  alignas(file_dedupe_range) std::array<std::byte, sizeof head + sizeof part> request;
  std::memcpy(request.data(), &head, sizeof head);
  std::memcpy(request.data() + sizeof head, &part, sizeof part);
  if (::ioctl(source, FIDEDUPERANGE, request.data()) != 0)
    return std::error_code(errno, std::generic_category());
  std::memcpy(&part, request.data() + sizeof head, sizeof part);
  if (part.status < 0) return std::error_code(-part.status, std::generic_category());
  if (part.status == FILE_DEDUPE_RANGE_DIFFERS) return std::optional<std::uint64_t>();
  return std::optional<std::uint64_t>(part.bytes_deduped);
}

std::optional<std::uint64_t> placeOf(int descriptor) {
  ExtentMap<1> map(0);
  const auto extents = map.ask(descriptor);
  if (!extents || extents->empty()) return std::nullopt;
  const fiemap_extent& extent = extents->front();
  if (extent.fe_flags & (FIEMAP_EXTENT_UNKNOWN | FIEMAP_EXTENT_DELALLOC)) return std::nullopt;
  return extent.fe_physical;
}

}  // namespace Orvane
