// SPDX-License-Identifier: MIT
#pragma once

#include <map>
#include <string>
#include <vector>

#include <Varnel/Platform/Values/Result.h>

namespace Orvane {

/// Names of files, by the absolute paths of the folders that they are in.
using FilesByFolder = std::map<std::string, std::vector<std::string>>;

/// What stands between two names of a list.
enum class NameEnd : char { line = '\n', null = '\0' };

/// Reads a list of paths from a file, or from standard input for "-". Relative ones begin at the
/// working folder. Links on the way to a file are followed, and one in its place is not. What a
/// path leads to shows when it is scanned. Fails with the reason when the list cannot be read.
[[nodiscard]] Varnel::Platform::Result<FilesByFolder, std::string> readFileList(
    const std::string& name, NameEnd end);

}  // namespace Orvane
