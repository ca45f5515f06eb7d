// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <istream>
#include <string>
#include <string_view>
#include <vector>

#include <Varnel/Platform/Values/Result.h>

namespace Orvane {

struct ScanResult;

/// A file as a scan has found it. One that was replaced or written to since has another inode, size
/// or time. Where inodes do not last, another one tells nothing.
struct ReportFile {
  std::string path;  ///< Absolute, byte for byte.
  std::uint64_t inode = 0;
  std::int64_t modified = 0;  ///< In seconds since 1970-01-01 UTC, and
  std::int32_t nanoseconds = 0;
  std::vector<std::string> names{};  ///< Further paths of the same file: hard links.
  bool isReference = false;          ///< It stays, whatever is chosen.

  bool operator==(const ReportFile&) const = default;
};

/// Files that had the same content.
struct ReportGroup {
  std::uint64_t size = 0;  ///< Of each file, in bytes.
  std::vector<ReportFile> files{};

  bool operator==(const ReportGroup&) const = default;
};

/// What a scan has found, as its JSON object tells it. A plain value.
struct Report {
  bool isPartial = false;  ///< The scan was interrupted.
  /// The folders that were scanned, in the order in which they were named. Those that are not
  /// absolute tell nothing.
  std::vector<std::string> roots{};
  std::vector<ReportGroup> groups{};

  bool operator==(const Report&) const = default;
};

/// Whether the path lies in the folder, at any depth. Both are absolute.
[[nodiscard]] bool isBelow(std::string_view path, std::string_view folder);

/// Reads the JSON object of a scan, whoever has written it: numbers and paths may be anything.
/// Fails, with a text for people, where it is no such object or too long to be one.
[[nodiscard]] Varnel::Platform::Result<Report, std::string> readReport(std::istream& text);

/// The same straight from a scan, but for the roots, which the result does not know.
[[nodiscard]] Report reportOf(const ScanResult& result);

}  // namespace Orvane
