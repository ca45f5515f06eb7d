// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <optional>
#include <string>

#include <nlohmann/json_fwd.hpp>

#include <Varnel/Platform/Values/PlatformError.h>
#include <Varnel/Platform/Values/Result.h>

namespace Orvane {

// The rows of a database of the product, whichever that is and whatever version has written it. The
// file is there, and no link.

[[nodiscard]] Varnel::Platform::Result<std::int64_t> countRows(const std::string& path,
                                                               const std::string& table);

/// Every table with its rows, which have their columns by name.
[[nodiscard]] Varnel::Platform::Result<nlohmann::ordered_json> readRows(const std::string& path);

/// What has become of rows that were to be wiped.
struct Wiping {
  std::optional<Varnel::Platform::PlatformError> error;  ///< Then all are there still.
  bool isShared = false;  ///< They are gone, and another process has the file open.
};

/// Deletes all rows of the user's, so that not even their bytes stay in the file. With the lock for
/// opening held, which keeps other processes from opening it meanwhile.
[[nodiscard]] Wiping wipeRows(const std::string& path);

}  // namespace Orvane
