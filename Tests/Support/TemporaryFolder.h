// SPDX-License-Identifier: MIT
#pragma once

#include <stdlib.h>

#include <filesystem>
#include <fstream>
#include <string>
#include <string_view>

namespace Varnel::Tests {

/// A new empty folder that goes away with the object, whatever is in it.
class TemporaryFolder final {
 public:
  TemporaryFolder() : TemporaryFolder(std::filesystem::temp_directory_path()) {}

  /// On a disk in memory, if there is one: for tests that make files durable hundreds of times.
  static TemporaryFolder inMemory() {
    const std::filesystem::path memory = "/dev/shm";
    std::error_code ignored;
    return std::filesystem::is_directory(memory, ignored) ? TemporaryFolder(memory)
                                                          : TemporaryFolder();
  }

  ~TemporaryFolder() {
    std::error_code ignored;
    std::filesystem::remove_all(path_, ignored);
  }
  TemporaryFolder(const TemporaryFolder&) = delete;
  TemporaryFolder& operator=(const TemporaryFolder&) = delete;

  [[nodiscard]] const std::filesystem::path& path() const { return path_; }

  /// Writes a file, and the folders above it, and returns its path.
  std::filesystem::path write(const std::filesystem::path& name, std::string_view bytes) const {
    const std::filesystem::path file = path_ / name;
    std::filesystem::create_directories(file.parent_path());
    std::ofstream(file, std::ios::binary) << bytes;
    return file;
  }

 private:
  explicit TemporaryFolder(const std::filesystem::path& parent) {
    std::string pattern = (parent / "varnel-XXXXXX").string();
    path_ = std::filesystem::canonical(::mkdtemp(pattern.data()));
  }

  std::filesystem::path path_;
};

}  // namespace Varnel::Tests
