// SPDX-License-Identifier: MIT
#pragma once

#include <unistd.h>

#include <utility>

namespace Varnel::Platform::POSIX {

/// Owns a file descriptor; -1 stands for none.
class FileDescriptor final {
 public:
  FileDescriptor() = default;
  explicit FileDescriptor(int descriptor) : descriptor_(descriptor) {}
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
  int descriptor_ = -1;
};

}  // namespace Varnel::Platform::POSIX
