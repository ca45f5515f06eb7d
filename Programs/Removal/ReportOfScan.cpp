// SPDX-License-Identifier: MIT
#include <memory>
#include <utility>

#include <Removal/Report.h>
#include <Scan/OpenFolders.h>
#include <Scan/ScanResult.h>

namespace Orvane {
namespace {

constexpr std::int64_t nanosecondsPerSecond = 1'000'000'000;

std::optional<FileStatus> statusOf(FileNumber number, const FileTree& tree, OpenFolders& folders) {
  const auto folder = folders.open(tree.folderOf(number));
  if (!folder) return std::nullopt;
  const auto file = (*folder)->open(tree.nameOf(number), ReadingPlan::parts);
  if (!file) return std::nullopt;
  const auto status = (*file)->status();
  if (!status || !tree.isUnchanged(number, *status)) return std::nullopt;
  return *status;
}

}  // namespace

Report reportOf(const ScanResult& result, bool isPartial) {
  Report report{.isPartial = isPartial};
  OpenFolders folders(systemFileSystem());
  for (const DuplicateGroup& found : result.groups) {
    ReportGroup group{.size = found.size};
    for (std::uint32_t i = 0; i < found.count; ++i) {
      const FileNumber number = result.files[found.begin + i];
      const auto status = statusOf(number, *result.tree, folders);
      if (!status) continue;
      // Rounded down, so that nanoseconds are never below 0.
      const std::int64_t nanoseconds =
          ((status->modifiedAt % nanosecondsPerSecond) + nanosecondsPerSecond) %
          nanosecondsPerSecond;
      group.files.push_back({.path = result.tree->pathOf(number),
                             .inode = status->identity.inode,
                             .modified = (status->modifiedAt - nanoseconds) / nanosecondsPerSecond,
                             .nanoseconds = static_cast<std::int32_t>(nanoseconds)});
    }
    if (group.files.size() > 1) report.groups.push_back(std::move(group));
  }
  return report;
}

}  // namespace Orvane
