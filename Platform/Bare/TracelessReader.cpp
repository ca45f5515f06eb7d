// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Ports/TracelessReader.h>

#include <unistd.h>

#include <cerrno>

namespace Varnel::Platform {

// POSIX does not tell what the cache holds, so nothing can be given back.
TracelessReader::~TracelessReader() = default;

Result<std::size_t, std::error_code> TracelessReader::read(std::span<std::byte> buffer,
                                                           std::uint64_t offset) {
  while (true) {
    const ssize_t count =
        ::pread(descriptor_, buffer.data(), buffer.size(), static_cast<off_t>(offset));
    if (count >= 0) return static_cast<std::size_t>(count);
    if (errno != EINTR) return std::error_code(errno, std::generic_category());
  }
}

}  // namespace Varnel::Platform
