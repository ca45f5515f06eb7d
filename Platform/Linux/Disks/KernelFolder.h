// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include <Varnel/Platform/POSIX/FileDescriptor.h>

namespace Varnel::Platform::Linux {

/// A folder of small tables that the kernel or udev keeps, as those below /sys. Paths are relative
/// to it and may climb out with "..". What cannot be read is absent. Any thread.
class KernelFolder final {
 public:
  explicit KernelFolder(const char* path);

  /// Whether the folder itself could be opened.
  explicit operator bool() const { return static_cast<bool>(folder_); }

  /// The sorted names of the entries of a folder below; empty when it cannot be read.
  [[nodiscard]] std::vector<std::string> names(const std::string& folder = ".") const;

  /// Where a symbolic link points, as it is written.
  [[nodiscard]] std::optional<std::string> link(const std::string& path) const;

  /// The bytes of a file, 4096 at most.
  [[nodiscard]] std::optional<std::string> bytes(const std::string& path) const;

  [[nodiscard]] bool contains(const std::string& path) const;

 private:
  POSIX::FileDescriptor folder_;
};

/// The text between the leading and the trailing blanks and control characters.
[[nodiscard]] std::string trimmed(std::string_view text);

}  // namespace Varnel::Platform::Linux
