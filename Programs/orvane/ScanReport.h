// SPDX-License-Identifier: MIT
#pragma once

#include <chrono>
#include <cstddef>
#include <string>
#include <vector>

#include <orvane/Command.h>
#include <orvane/TextParts.h>

namespace Orvane {

struct ScanResult;

/// What a report tells of its scan beside the result.
struct ScanFacts {
  std::chrono::sys_seconds startedAt{};
  std::vector<std::string> folders{};  ///< In the order in which they were named.
};

/// The result for programs, and for `orvane trash` and `orvane share`: one JSON object on one line,
/// with `maxGroups` groups of folders and of files at most. docs/scan-report.md explains it, and
/// `scanReportFields` each member.
///
/// Returns, as the next, whether all could be written, and ends at the first part that could not.
[[nodiscard]] bool writeReport(const ScanResult& result, const ScanFacts& facts,
                               std::size_t maxGroups, const TextWriter& write);

/// The result for `xargs -0` and the like: the paths of each group, each with a zero byte behind
/// it, and one more behind the group.
[[nodiscard]] bool writePathList(const ScanResult& result, std::size_t maxGroups,
                                 const TextWriter& write);

/// The members of the report, as help and manual page explain them.
[[nodiscard]] std::vector<JSONField> scanReportFields();

}  // namespace Orvane
