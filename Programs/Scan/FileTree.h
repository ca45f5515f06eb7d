// SPDX-License-Identifier: MIT
#pragma once

#include <deque>
#include <string>
#include <vector>

#include <Scan/FileSystem.h>
#include <Scan/Loss.h>

namespace Orvane {

struct ScanControl;

/// A folder that the walk has listed. It knows its way up rather than its path, so that a deep tree
/// takes no more memory than a wide one.
struct Folder {
  const Folder* parent = nullptr;  ///< Kept by the tree; null for a given folder.
  std::string name;                ///< For a given folder its path, which is empty for "/".
  FileIdentity identity{};

  [[nodiscard]] std::string path() const;
};

/// A regular file that the walk found, under one of its names.
struct FileRecord {
  const Folder* folder;  ///< Kept by the tree.
  std::string name;
  FileStatus status;

  [[nodiscard]] std::string path() const;
};

/// Whether the first path stands before the second in the order of their bytes.
[[nodiscard]] bool pathPrecedes(const FileRecord& first, const FileRecord& second);

/// Everything that lies in some folders and below them.
///
///     FileTree tree = walkFolders({"/home/u/Pictures"}, systemFileSystem(), 4, control);
///
/// Symbolic links are not followed, and a folder that is mounted again below itself is not entered
/// again. A folder that is given twice, or lies in another given one, is walked once. A value that
/// can be moved but not copied; the records refer to its folders.
struct FileTree {
  std::deque<Folder> folders;
  std::vector<FileRecord> files;          ///< In no order; hard links are separate records.
  std::vector<LostPath> unreadableFiles;  ///< In the order of their paths, as the next.
  std::vector<LostPath> unreadableFolders;
  std::vector<LostPath> lostRoots;  ///< Given folders that could not be listed.
};

/// Walks the folders, given by absolute paths without symbolic links, with several threads. It
/// returns early, with what it has so far, when `control` says so or one of them cannot be listed.
[[nodiscard]] FileTree walkFolders(const std::vector<std::string>& folders, FileSystem& fileSystem,
                                   unsigned threads, ScanControl& control);

}  // namespace Orvane
