// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Ports/TracelessReader.h>

#include <fcntl.h>
#include <sys/mman.h>
#include <sys/stat.h>
#include <sys/syscall.h>
#include <sys/uio.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>

namespace Varnel::Platform {
namespace {

constexpr int dropBehind = 0x80;  // RWF_DONTCACHE, Linux 6.14; older headers lack it

std::error_code lastError() {
  return {errno, std::generic_category()};
}

/// Older kernels and file systems lack the call or its flag, some sandboxes forbid it.
bool saysThatItIsNotToBeHad(const std::error_code& error) {
  const int code = error.value();
  return code == EOPNOTSUPP || code == ENOSYS || code == EPERM || code == EINVAL;
}

}  // namespace

TracelessReader::~TracelessReader() {
  for (const Range& range : absent_)
    ::posix_fadvise(descriptor_, static_cast<off_t>(range.begin),
                    static_cast<off_t>(range.end - range.begin), POSIX_FADV_DONTNEED);
}

TracelessReader::Count TracelessReader::read(std::span<std::byte> buffer, std::uint64_t offset) {
  if (way_ == Way::droppingBehind) {
    const Count count = readWith(dropBehind, buffer, offset);
    if (count || !saysThatItIsNotToBeHad(count.error())) return count;
    way_ = Way::fromCache;
  }
  if (way_ == Way::fromCache) {
    const Count count = readWith(RWF_NOWAIT, buffer, offset);
    if (count) return count;
    way_ = Way::noting;
  }
  noteAbsentRanges(offset, buffer.size());
  while (true) {
    const ssize_t count =
        ::pread(descriptor_, buffer.data(), buffer.size(), static_cast<off_t>(offset));
    if (count >= 0) return static_cast<std::size_t>(count);
    if (errno != EINTR) return lastError();
  }
}

TracelessReader::Count TracelessReader::readWith(int flags, std::span<std::byte> buffer,
                                                 std::uint64_t offset) const {
  const iovec part{.iov_base = buffer.data(), .iov_len = buffer.size()};
  while (true) {
    const ssize_t count = ::preadv2(descriptor_, &part, 1, static_cast<off_t>(offset), flags);
    if (count >= 0) return static_cast<std::size_t>(count);
    if (errno != EINTR) return lastError();
  }
}

// Costs a mapping, so it is done where the disk has to work anyway, and only as far as the system
// may read ahead: the rest of a disk image of some terabytes would take minutes. What the system
// began to read ahead when the cache was asked still counts as absent, as long as it is on its way.
// The kernel calls everything present in a file that is not the user's own.
void TracelessReader::noteAbsentRanges(std::uint64_t offset, std::size_t size) {
  constexpr std::uint64_t maxAhead = 16u << 20;
  const bool goesOn = noted_.begin <= offset && offset <= noted_.end;
  if (goesOn && offset + size + maxAhead <= noted_.end) return;
  const auto pageSize = static_cast<std::uint64_t>(::sysconf(_SC_PAGESIZE));
  const std::uint64_t begin = goesOn ? noted_.end : offset - offset % pageSize;
  const std::uint64_t end = (offset + size) / pageSize * pageSize + 2 * maxAhead;
  noted_ = {goesOn ? noted_.begin : begin, end};
  struct stat status {};
  if (::fstat(descriptor_, &status) != 0 || !S_ISREG(status.st_mode)) return;
  const std::uint64_t last = std::min(end, static_cast<std::uint64_t>(status.st_size));
  if (last <= begin) return;
  void* window =
      ::mmap(nullptr, last - begin, PROT_READ, MAP_SHARED, descriptor_, static_cast<off_t>(begin));
  if (window == MAP_FAILED) return;
  std::vector<unsigned char> pages((last - begin + pageSize - 1) / pageSize, 1);
  (void)::mincore(window, last - begin, pages.data());
  ::munmap(window, last - begin);
  for (std::size_t page = 0; page < pages.size(); ++page) {
    if (pages[page] & 1) continue;
    const std::uint64_t place = begin + page * pageSize;
    if (!absent_.empty() && absent_.back().end == place)
      absent_.back().end += pageSize;
    else
      absent_.push_back({place, place + pageSize});
  }
}

}  // namespace Varnel::Platform
