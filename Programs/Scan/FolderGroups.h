// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <vector>

#include <Scan/ScanResult.h>

namespace Orvane {

/// Fills in the result's groups of folders. `contents` has for each file of the tree a number that
/// files of equal content have in common, and 0 for a file of whose content no other is known.
/// Takes a time that grows with the files, and memory with the folders.
void findFolderGroups(ScanResult& result, const std::vector<std::uint32_t>& contents);

/// Whether the folders are different ones, and all of one class. Then what is said of their class
/// holds for what they have in common.
[[nodiscard]] bool areOfOneClass(std::vector<std::uint32_t> folders,
                                 const std::vector<std::uint32_t>& classes);

}  // namespace Orvane
