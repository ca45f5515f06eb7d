// SPDX-License-Identifier: MIT
#pragma once

#include <deque>
#include <string>
#include <vector>

#include <orvane/Scan/FileSystem.h>
#include <orvane/Scan/Loss.h>

namespace Orvane {

struct ScanControl;

/// A regular file that the walk found, under one of its names.
struct FileRecord {
  const std::string* folder;  ///< Kept by the tree.
  std::string name;
  FileStatus status;

  [[nodiscard]] std::string path() const;
};

/// Whether the first path stands before the second in the order of their bytes. Builds no path.
[[nodiscard]] bool pathPrecedes(const FileRecord& first, const FileRecord& second);

/// Everything that lies in some folders and below them.
///
///     FileTree tree = walkFolders({"/home/u/Pictures"}, systemFileSystem(), 4, control);
///
/// Symbolic links are not followed, and a folder that is mounted again below itself is not entered
/// again. A folder that is given twice, or lies in another one given, is walked once. A value that
/// moves; the records refer to its folders.
struct FileTree {
  struct Failure {
    std::string path;
    Loss loss;
  };

  std::deque<std::string> folders;
  std::vector<FileRecord> files;         ///< In no order; hard links are separate records.
  std::vector<Failure> unreadableFiles;  ///< In the order of their paths, as the next.
  std::vector<Failure> unreadableFolders;
};

/// Walks the folders, given by absolute paths without symbolic links, with several threads. It
/// returns early, with what it has so far, when `control` says so.
[[nodiscard]] FileTree walkFolders(const std::vector<std::string>& folders, FileSystem& fileSystem,
                                   unsigned threads, ScanControl& control);

}  // namespace Orvane
