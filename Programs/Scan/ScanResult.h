// SPDX-License-Identifier: MIT
#pragma once

#include <algorithm>
#include <cstdint>
#include <memory>
#include <string>
#include <vector>

#include <Scan/FileTree.h>
#include <Scan/Loss.h>

namespace Orvane {

/// Files of the same content, at least two.
struct DuplicateGroup {
  std::uint64_t size = 0;   ///< Of each file, in bytes; never 0.
  std::uint32_t begin = 0;  ///< Among the result's files.
  std::uint32_t count = 0;
  std::uint32_t references = 0;  ///< How many of the files are to stay.

  /// How many may go: all that need not stay, or all but one.
  [[nodiscard]] std::uint32_t removable() const { return count - std::max(references, 1u); }
  /// The bytes that those take up.
  [[nodiscard]] std::uint64_t wastedBytes() const { return size * removable(); }
};

/// The figures of a scan. Every regular file is counted in `files`; the members below it count
/// those that had no part in the comparison.
struct ScanTotals {
  std::uint64_t folders = 0;
  std::uint64_t files = 0;
  std::uint64_t bytes = 0;  ///< Of all files, hard links once.
  std::uint64_t emptyFiles = 0;
  std::uint64_t referenceFiles = 0;  ///< Those that are to stay.
  std::uint64_t hardLinks = 0;       ///< Further names of files already counted.
  std::uint64_t unreadableFiles = 0;
  std::uint64_t vanishedFiles = 0;
  std::uint64_t changedFiles = 0;
  std::uint64_t unreadableFolders = 0;
  std::uint64_t duplicateFiles = 0;  ///< Files that could go: see `DuplicateGroup::removable`.
  std::uint64_t wastedBytes = 0;

  bool operator==(const ScanTotals&) const = default;
};

/// The groups, most wasted bytes first and then by their first path, and the totals. When a folder
/// to scan could not be read there are neither: nothing was scanned. Millions of paths take much
/// memory, so the result holds the files' numbers and makes the paths when they are asked for.
struct ScanResult {
  std::vector<LostPath> lostFolders{};  ///< Of those to scan.
  std::vector<DuplicateGroup> groups{};
  ScanTotals totals{};
  std::vector<FileNumber> files{};  ///< Of all groups.
  std::shared_ptr<const FileTree> tree{};

  /// Whether the file is to stay.
  [[nodiscard]] bool isReference(FileNumber file) const { return tree->folderOf(file).isReference; }

  /// One path of each of the group's files, absolute, in the order of their bytes.
  [[nodiscard]] std::vector<std::string> pathsOf(const DuplicateGroup& group) const {
    std::vector<std::string> paths;
    for (std::uint32_t i = 0; i < group.count; ++i)
      paths.push_back(tree->pathOf(files[group.begin + i]));
    return paths;
  }
};

}  // namespace Orvane
