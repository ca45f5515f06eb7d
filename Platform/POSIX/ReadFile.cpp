// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Ports/ReadFile.h>

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <Varnel/Platform/POSIX/FileDescriptor.h>
#include <Varnel/Platform/POSIX/LastError.h>
#include <Varnel/Platform/Values/SystemText.h>

namespace Varnel::Platform {

Result<std::string, std::error_code> readFile(const std::string& path, std::size_t maxSize) {
  constexpr std::size_t step = 1u << 16;
  if (isCutShort(path)) return std::make_error_code(std::errc::invalid_argument);
  struct stat facts {};
  // Checked before the file is opened: opening waits for a pipe's writer, and wakes devices.
  if (::stat(path.c_str(), &facts) != 0) return POSIX::lastError();
  if (!S_ISREG(facts.st_mode)) return std::make_error_code(std::errc::invalid_argument);
  const POSIX::FileDescriptor file(::open(path.c_str(), O_RDONLY | O_CLOEXEC));
  if (!file) return POSIX::lastError();

  // Read to the end instead of to the file's size: it may grow, and the kernel's files have no
  // size.
  std::string bytes;
  for (;;) {
    const std::size_t size = bytes.size();
    bytes.resize(size + step);
    const ssize_t count = ::read(file.get(), bytes.data() + size, step);
    if (count < 0 && errno != EINTR) return POSIX::lastError();
    bytes.resize(size + static_cast<std::size_t>(count < 0 ? 0 : count));
    if (count == 0) return bytes;
    if (bytes.size() > maxSize) return std::make_error_code(std::errc::file_too_large);
  }
}

}  // namespace Varnel::Platform
