// SPDX-License-Identifier: MIT
#pragma once

#include <set>
#include <string_view>
#include <system_error>

#include <Varnel/Platform/Values/Result.h>

namespace Orvane {

/// What the system's package manager has installed. One thread at a time.
class PackagedFiles {
 public:
  virtual ~PackagedFiles() = default;
  PackagedFiles& operator=(const PackagedFiles&) = delete;

  /// Those of the paths, absolute and without links among their folders, that belong to packages.
  /// None where there is no package manager that is known; an error where it cannot be asked.
  [[nodiscard]] virtual Varnel::Platform::Result<std::set<std::string_view>, std::error_code> among(
      const std::set<std::string_view>& paths) = 0;
};

}  // namespace Orvane
