// SPDX-License-Identifier: MIT
#pragma once

#include <atomic>
#include <filesystem>
#include <fstream>
#include <random>
#include <string>
#include <string_view>

namespace Orvane::Testing {

/// A new folder that goes away, with all in it, when the object does.
class TemporaryFolder final {
 public:
  TemporaryFolder() {
    static std::atomic<int> count{0};
    do {
      path_ = std::filesystem::canonical(std::filesystem::temp_directory_path()) /
              ("orvane-" + std::to_string(std::random_device{}()) + "-" + std::to_string(++count));
    } while (!std::filesystem::create_directory(path_));
  }
  TemporaryFolder(const TemporaryFolder&) = delete;
  TemporaryFolder& operator=(const TemporaryFolder&) = delete;
  ~TemporaryFolder() {
    std::error_code ignored;
    std::filesystem::remove_all(path_, ignored);
  }

  [[nodiscard]] std::string path(std::string_view name = "") const {
    return name.empty() ? path_.string() : (path_ / name).string();
  }

  /// Writes a file, making the folders on its way, and returns its path.
  std::string write(std::string_view name, std::string_view content) const {
    const std::filesystem::path file = path_ / name;
    std::filesystem::create_directories(file.parent_path());
    std::ofstream(file, std::ios::binary) << content;
    return file.string();
  }

 private:
  std::filesystem::path path_;
};

}  // namespace Orvane::Testing
