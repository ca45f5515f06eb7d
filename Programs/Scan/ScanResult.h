// SPDX-License-Identifier: MIT
#pragma once

#include <algorithm>
#include <cstdint>
#include <memory>
#include <span>
#include <string>
#include <vector>

#include <Scan/FileTree.h>
#include <Scan/Loss.h>

namespace Orvane {

/// Files of the same content, at least two.
struct DuplicateGroup {
  std::uint64_t size = 0;         ///< Of each file, in bytes; never 0.
  std::uint64_t wastedBytes = 0;  ///< What is freed when one file is left, as far as that is known.
  std::uint32_t begin = 0;        ///< Among the result's files.
  std::uint32_t count = 0;
};

/// A file of a group.
struct DuplicateFile {
  std::string path;         ///< The first in the order of their bytes; of those to stay, if one is.
  FileIdentity identity;    ///< With the next, the state in which it was compared.
  std::int64_t modifiedAt;  ///< Nanoseconds since 1970.
  std::vector<std::string>
      names{};               ///< Its further paths, in order: hard links that the scan found.
  bool isReference = false;  ///< As `ScanResult::isReference`.
};

/// Folders that hold the same at every depth: files of the same names and contents, and folders of
/// the same names. At least two. One with something that took no part in the comparison, say a
/// symbolic link or a file that could not be read, is in no group.
struct FolderGroup {
  std::uint64_t bytes = 0;        ///< Of each folder's files.
  std::uint64_t files = 0;        ///< In each folder.
  std::uint64_t wastedBytes = 0;  ///< By the groups of files that this one stands for.
  std::uint32_t begin = 0;        ///< Among the result's folders.
  std::uint32_t count = 0;
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
  std::uint64_t unreachedFiles = 0;  ///< Those that were to be read when the scan was cancelled.
  std::uint64_t unreadableFolders = 0;
  std::uint64_t duplicateFiles = 0;  ///< Files that could go: see `DuplicateGroup::removable`.
  std::uint64_t wastedBytes = 0;

  bool operator==(const ScanTotals&) const = default;
};

/// A further name of a file, both as numbers in the tree.
struct FileLink {
  FileNumber file;
  FileNumber name;
};

/// The groups, most wasted bytes first and then by their first path, and the totals. When a folder
/// to scan could not be read there are neither: nothing was scanned. Millions of paths take much
/// memory, so the result holds the files' numbers and makes the paths when they are asked for.
struct ScanResult {
  std::vector<LostPath> lostFolders{};  ///< Of those to scan.
  /// Whether the scan was cancelled. What the groups say is true then, but files are missing.
  bool isPartial = false;
  std::vector<DuplicateGroup> groups{};
  /// The largest ones: what they imply of the folders in them is not said again.
  std::vector<FolderGroup> folderGroups{};
  ScanTotals totals{};
  std::vector<FileNumber> files{};         ///< Of all groups.
  std::vector<std::int64_t> modifiedAt{};  ///< Of those files.
  std::vector<FileLink> links{};           ///< Of those files; sorted by file.
  std::vector<std::uint32_t> folders{};    ///< Of all groups of folders: numbers in the tree.
  /// For each folder of the tree the number of those that hold the same, 0 when it is alone.
  std::vector<std::uint32_t> folderClasses{};
  std::shared_ptr<const FileTree> tree{};

  /// One path of each of the group's files, absolute, in the order of their bytes.
  [[nodiscard]] std::vector<std::string> pathsOf(const DuplicateGroup& group) const;
  /// The files, in the same order. A group may have millions: `fileAt` takes one at a time.
  [[nodiscard]] std::vector<DuplicateFile> filesOf(const DuplicateGroup& group) const;
  /// The file at a place of `files`, from the `begin` of its group on.
  [[nodiscard]] DuplicateFile fileAt(std::uint32_t index) const;
  /// The folders' paths, in the order of their bytes.
  [[nodiscard]] std::vector<std::string> pathsOf(const FolderGroup& group) const;

  [[nodiscard]] std::span<const FileLink> linksOf(FileNumber file) const;
  /// Whether the file, under any of its names, is there to be compared with, and to stay.
  [[nodiscard]] bool isReference(FileNumber file) const;

  /// Whether the groups of folders say all that this group says.
  [[nodiscard]] bool isImplied(const DuplicateGroup& group) const;
};

}  // namespace Orvane
