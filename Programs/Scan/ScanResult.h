// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include <Scan/Loss.h>

namespace Orvane {

/// Files of the same content, at least two, by one path each.
struct DuplicateGroup {
  std::uint64_t size = 0;          ///< Of each file, in bytes; never 0.
  std::vector<std::string> paths;  ///< Absolute, in the order of their bytes.

  /// The bytes that all files but one take up.
  [[nodiscard]] std::uint64_t wastedBytes() const { return size * (paths.size() - 1); }

  bool operator==(const DuplicateGroup&) const = default;
};

/// The figures of a scan. Every regular file is counted in `files`; the members below it count
/// those that had no part in the comparison.
struct ScanTotals {
  std::uint64_t folders = 0;
  std::uint64_t files = 0;
  std::uint64_t bytes = 0;  ///< Of all files, hard links once.
  std::uint64_t emptyFiles = 0;
  std::uint64_t hardLinks = 0;  ///< Further names of files already counted.
  std::uint64_t unreadableFiles = 0;
  std::uint64_t vanishedFiles = 0;
  std::uint64_t changedFiles = 0;
  std::uint64_t unreadableFolders = 0;
  std::uint64_t duplicateFiles = 0;  ///< Files that could go: all but one of each group.
  std::uint64_t wastedBytes = 0;

  bool operator==(const ScanTotals&) const = default;
};

/// The groups, most wasted bytes first and then by their first path, and the totals. When a folder
/// to scan could not be read there are neither: nothing was scanned.
struct ScanResult {
  std::vector<LostPath> lostFolders{};  ///< Of those to scan.
  std::vector<DuplicateGroup> groups{};
  ScanTotals totals{};
};

}  // namespace Orvane
