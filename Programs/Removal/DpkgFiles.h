// SPDX-License-Identifier: MIT
#pragma once

#include <filesystem>

#include <Removal/PackagedFiles.h>

namespace Orvane {

/// The files of Debian's packages, by the lists that dpkg keeps. Where there are none nothing is
/// packaged.
class DpkgFiles final : public PackagedFiles {
 public:
  explicit DpkgFiles(std::filesystem::path folder = "/var/lib/dpkg");

  [[nodiscard]] Varnel::Platform::Result<std::set<std::string_view>, std::error_code> among(
      const std::set<std::string_view>& paths) override;

 private:
  const std::filesystem::path folder_;
};

}  // namespace Orvane
