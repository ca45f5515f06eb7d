// SPDX-License-Identifier: MIT
#pragma once

#include <vector>

#include <Scan/FileTree.h>

namespace Orvane {

/// Sorts files of the tree into the order of the bytes of their paths, without making the paths:
/// it goes down the tree, and compares names in one folder only.
void sortByPath(const FileTree& tree, std::vector<FileNumber>& files);

}  // namespace Orvane
