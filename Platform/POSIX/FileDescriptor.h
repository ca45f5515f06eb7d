// SPDX-License-Identifier: MIT
#pragma once

#include <fcntl.h>
#include <unistd.h>

#include <utility>

namespace Varnel::Platform::POSIX {

/// Owns a file descriptor; -1 stands for none. It is never one of the three standard streams: where
/// a host has closed those, the system gives their numbers to files that are opened next, and other
/// code would print into them. So the number may differ from the given one.
class FileDescriptor final {
 public:
  FileDescriptor() = default;
  explicit FileDescriptor(int descriptor) : descriptor_(awayFromStandardStreams(descriptor)) {}
  FileDescriptor(FileDescriptor&& other) noexcept
      : descriptor_(std::exchange(other.descriptor_, -1)) {}
  FileDescriptor& operator=(FileDescriptor&& other) noexcept {
    std::swap(descriptor_, other.descriptor_);
    return *this;
  }
  ~FileDescriptor() {
    if (descriptor_ >= 0) ::close(descriptor_);
  }

  [[nodiscard]] int get() const { return descriptor_; }

  /// Gives the descriptor away, to be closed by somebody else.
  [[nodiscard]] int release() { return std::exchange(descriptor_, -1); }

  explicit operator bool() const { return descriptor_ >= 0; }

 private:
  static int awayFromStandardStreams(int descriptor) {
    if (descriptor < 0 || descriptor > STDERR_FILENO) return descriptor;
    const int moved = ::fcntl(descriptor, F_DUPFD_CLOEXEC, STDERR_FILENO + 1);
    ::close(descriptor);
    return moved;
  }

  int descriptor_ = -1;
};

}  // namespace Varnel::Platform::POSIX
