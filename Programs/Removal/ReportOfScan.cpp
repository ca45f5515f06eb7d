// SPDX-License-Identifier: MIT
#include <utility>

#include <Removal/Report.h>
#include <Scan/ScanResult.h>

namespace Orvane {
namespace {

ReportFile reportOf(DuplicateFile found) {
  constexpr std::int64_t perSecond = 1'000'000'000;
  // Rounded down, so that nanoseconds are never below 0.
  const std::int64_t nanoseconds = (found.modifiedAt % perSecond + perSecond) % perSecond;
  return {.path = std::move(found.path),
          .inode = found.identity.inode,
          .modified = (found.modifiedAt - nanoseconds) / perSecond,
          .nanoseconds = static_cast<std::int32_t>(nanoseconds),
          .names = std::move(found.names),
          .isReference = found.isReference};
}

}  // namespace

Report reportOf(const ScanResult& result) {
  Report report{.isPartial = result.isPartial};
  for (const DuplicateGroup& found : result.groups) {
    ReportGroup group{.size = found.size};
    for (DuplicateFile& file : result.filesOf(found))
      group.files.push_back(reportOf(std::move(file)));
    report.groups.push_back(std::move(group));
  }
  return report;
}

}  // namespace Orvane
