// SPDX-License-Identifier: MIT
#include <fcntl.h>

#include <cerrno>

#include <Scan/SystemCalls.h>

namespace Orvane {

const int openToPassThrough = O_RDONLY | O_DIRECTORY;

int openWithoutLinksAtOnce(int, const char*, int) {
  errno = ENOSYS;
  return -1;
}

// POSIX has no leases.
int openLeased(int, const char*) {
  errno = EAGAIN;
  return -1;
}

bool isInMemory(int) {
  return false;
}

bool keepsNumbers(int) {
  return true;
}

bool tellsSharedExtents(int) {
  return false;
}

std::optional<SharedExtents> sharedExtentsOf(int) {
  return std::nullopt;
}

FileResult<std::optional<std::uint64_t>> shareRange(int, int, std::uint64_t, std::uint64_t) {
  return std::make_error_code(std::errc::not_supported);
}

std::optional<std::uint64_t> placeOf(int) {
  return std::nullopt;
}

}  // namespace Orvane
