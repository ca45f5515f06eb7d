// SPDX-License-Identifier: MIT
#pragma once

#include <cstddef>
#include <string>
#include <system_error>

#include <Varnel/Platform/Values/Result.h>

namespace Varnel::Platform {

/// The bytes of a whole file, or the system's error (generic category): `no_such_file_or_directory`
/// when there is none, `file_too_large` when there are more than `maxSize` bytes.
///
///     const auto table = parseStringsTable(readFile(path).valueOr(""));
///
/// Folders, pipes and devices are refused (`invalid_argument`): reading them could fail late or
/// never end, and so are paths with a null character. May block as reading a file does; any thread.
[[nodiscard]] Result<std::string, std::error_code> readFile(const std::string& path,
                                                            std::size_t maxSize = 64u << 20);

}  // namespace Varnel::Platform
