// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <memory>
#include <string>
#include <vector>

#include <Scan/FileTree.h>
#include <Scan/Loss.h>

namespace Orvane {

class DiskTurns;
struct ScanControl;

/// What a walk found.
struct WalkResult {
  std::shared_ptr<const FileTree> tree;     ///< Hard links are separate files.
  std::uint64_t folders = 0;                ///< Those that were listed.
  std::vector<LostPath> unreadableFiles{};  ///< In the order of their paths, as the next.
  std::vector<LostPath> unreadableFolders{};
  std::vector<LostPath> lostRoots{};  ///< Given folders that could not be listed.
};

/// Walks folders, given by absolute paths without symbolic links, in turns: each disk with as many
/// tasks as it has places, and from inode to inode, for that is mostly how folders lie.
///
/// Symbolic links are not followed, and a folder that is mounted again below itself is not entered
/// again. A folder that is given twice, or lies in another given one, is walked once. Returns
/// early, with what it has so far, when `control` says so or a given folder cannot be listed.
[[nodiscard]] WalkResult walkFolders(const std::vector<std::string>& folders,
                                     FileSystem& fileSystem, DiskTurns& turns,
                                     ScanControl& control);

}  // namespace Orvane
