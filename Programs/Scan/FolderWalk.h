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
class ScanObserver;
struct ScanControl;
struct ScanRequest;

/// What a walk found.
struct WalkResult {
  std::shared_ptr<const FileTree> tree;     ///< Hard links are separate files.
  std::uint64_t folders = 0;                ///< Those that were listed.
  std::vector<LostPath> unreadableFiles{};  ///< In the order of their paths, as the next.
  std::vector<LostPath> unreadableFolders{};
  std::vector<LostPath> lostRoots{};  ///< Given folders that could not be listed.
};

/// Walks the folders of a request in turns: each disk with as many tasks as it has places, and from
/// inode to inode, for that is mostly how folders lie. Looks up its single files then.
///
/// Symbolic links are not followed, and a folder that is mounted again below itself is not entered
/// again. A folder that is given twice, or lies in another given one, is walked once. What is
/// mounted below is walked in the turns of its own disk, and not touched in those of another.
/// Pseudo file systems are left out, but for what is mounted in them in turn, and for given
/// folders. Returns early, with what it has so far, when `control` says so or a given folder cannot
/// be listed.
[[nodiscard]] WalkResult walkFolders(const ScanRequest& request, FileSystem& fileSystem,
                                     DiskTurns& turns, ScanObserver& observer,
                                     ScanControl& control);

}  // namespace Orvane
