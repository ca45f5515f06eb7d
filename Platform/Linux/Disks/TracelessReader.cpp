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

// Headers of older systems do not know of these.
constexpr int dropAfterReading = 0x80;  // RWF_DONTCACHE, Linux 6.14
constexpr long cachestat = 451;         // Linux 6.5

struct CachestatRange {
  std::uint64_t offset;
  std::uint64_t size;
};
struct CachestatAnswer {
  std::uint64_t cached;
  std::uint64_t others[4];
};

std::error_code lastError() {
  return {errno, std::generic_category()};
}

/// Older kernels and file systems lack the call or its flag, some sandboxes forbid it.
bool saysThatItIsNotToBeHad(int error) {
  return error == EOPNOTSUPP || error == ENOSYS || error == EPERM || error == EINVAL;
}

template <typename Call>
ssize_t uninterrupted(Call call) {
  ssize_t count = 0;
  do {
    count = call();
  } while (count < 0 && errno == EINTR);
  return count;
}

}  // namespace

TracelessReader::~TracelessReader() {
  for (const Range& range : absent_)
    ::posix_fadvise(descriptor_, static_cast<off_t>(range.offset), static_cast<off_t>(range.size),
                    POSIX_FADV_DONTNEED);
}

Result<std::size_t, std::error_code> TracelessReader::read(std::span<std::byte> buffer,
                                                           std::uint64_t offset) {
  const auto position = static_cast<off_t>(offset);
  if (giver_ != Giver::self) {
    const iovec part{.iov_base = buffer.data(), .iov_len = buffer.size()};
    const ssize_t count =
        uninterrupted([&] { return ::preadv2(descriptor_, &part, 1, position, dropAfterReading); });
    if (count >= 0) {
      giver_ = Giver::system;
      return static_cast<std::size_t>(count);
    }
    if (giver_ == Giver::system || !saysThatItIsNotToBeHad(errno)) return lastError();
    giver_ = Giver::self;
    noteAbsentRanges();
  }
  const ssize_t count =
      uninterrupted([&] { return ::pread(descriptor_, buffer.data(), buffer.size(), position); });
  if (count < 0) return lastError();
  return static_cast<std::size_t>(count);
}

// Before the first byte is read, because the system reads ahead of the reader.
void TracelessReader::noteAbsentRanges() {
  struct stat status {};
  if (::fstat(descriptor_, &status) != 0 || !S_ISREG(status.st_mode) || status.st_size <= 0) return;
  const auto fileSize = static_cast<std::uint64_t>(status.st_size);
  const auto pageSize = static_cast<std::uint64_t>(::sysconf(_SC_PAGESIZE));
  CachestatRange everything{};
  CachestatAnswer answer{};
  if (::syscall(cachestat, descriptor_, &everything, &answer, 0) == 0) {
    if (answer.cached == 0) absent_ = {{0, 0}};
    if (answer.cached == 0 || answer.cached >= (fileSize + pageSize - 1) / pageSize) return;
  }
  noteAbsentRanges(fileSize);
}

// Costs a mapping. The kernel calls everything present in a file that is not the user's own.
void TracelessReader::noteAbsentRanges(std::uint64_t fileSize) {
  constexpr std::uint64_t windowSize = 64u << 20;
  const auto pageSize = static_cast<std::uint64_t>(::sysconf(_SC_PAGESIZE));
  std::vector<unsigned char> pages;
  for (std::uint64_t begin = 0; begin < fileSize; begin += windowSize) {
    const std::uint64_t size = std::min(windowSize, fileSize - begin);
    void* window =
        ::mmap(nullptr, size, PROT_READ, MAP_SHARED, descriptor_, static_cast<off_t>(begin));
    if (window == MAP_FAILED) return;
    pages.assign((size + pageSize - 1) / pageSize, 1);
    (void)::mincore(window, size, pages.data());
    ::munmap(window, size);
    for (std::size_t page = 0; page < pages.size(); ++page) {
      if (pages[page] & 1) continue;
      const std::uint64_t offset = begin + page * pageSize;
      if (!absent_.empty() && absent_.back().offset + absent_.back().size == offset)
        absent_.back().size += pageSize;
      else
        absent_.push_back({offset, pageSize});
    }
  }
}

}  // namespace Varnel::Platform
