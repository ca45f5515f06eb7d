// SPDX-License-Identifier: MIT
#pragma once

#include <string>
#include <string_view>

#include <Tests/Support/TemporaryFolder.h>

namespace Orvane::Testing {

/// A temporary folder whose paths are texts, as scans take them.
class ScanFolder final {
 public:
  [[nodiscard]] std::string path(std::string_view name = "") const {
    return name.empty() ? folder_.path().string() : (folder_.path() / name).string();
  }

  /// Writes a file, and the folders above it, and returns its path.
  std::string write(std::string_view name, std::string_view content) const {
    return folder_.write(name, content).string();
  }

 private:
  Varnel::Tests::TemporaryFolder folder_;
};

}  // namespace Orvane::Testing
