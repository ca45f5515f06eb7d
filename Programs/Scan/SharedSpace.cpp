// SPDX-License-Identifier: MIT
#include <Scan/SharedSpace.h>

#include <algorithm>
#include <map>
#include <memory>
#include <mutex>
#include <span>
#include <tuple>

#include <Scan/DiskTurns.h>
#include <Scan/OpenFolders.h>
#include <Scan/ScanObserver.h>
#include <Scan/TaskGroup.h>

namespace Orvane {
namespace {

/// A second task pays off once each has this many files.
constexpr std::size_t worthATask = 1000;

/// The findings of all tasks.
struct Findings {
  std::mutex mutex;
  std::vector<FileSharing> all;
};

/// Asks about some files of one disk, folder by folder.
class SharingTask final : public TaskGroup::Task {
 public:
  SharingTask(const FileTree& tree, FileSystem& fileSystem, std::span<const FileNumber> files,
              const TaskGroup& group, Findings& findings)
      : tree_(tree), folders_(fileSystem), files_(files), group_(group), findings_(findings) {}

  std::optional<std::uint64_t> run(DiskTurn& turn) override {
    while (!files_.empty() && !group_.shouldStop()) {
      const FileNumber file = files_.front();
      files_ = files_.subspan(1);
      if (!isToldOf(file)) continue;
      ask(file);
      if (turn.isOver()) return tree_.file(file).inode;
    }
    const std::lock_guard lock(findings_.mutex);
    findings_.all.insert(findings_.all.end(), found_.begin(), found_.end());
    return std::nullopt;
  }

  void refuse() override {}

 private:
  /// Whether the file's volume tells; it is asked once.
  bool isToldOf(FileNumber file) {
    const std::uint32_t device = tree_.file(file).device;
    const auto known = isTold_.find(device);
    if (known != isTold_.end()) return known->second;
    const auto folder = folders_.open(tree_.folderOf(file));
    return folder && (isTold_[device] = (*folder)->mayShareExtents());
  }

  void ask(FileNumber file) {
    const auto folder = folders_.open(tree_.folderOf(file));
    if (!folder) return;
    const auto opened = (*folder)->open(tree_.nameOf(file), ReadingPlan::parts);
    const auto extents = opened ? (*opened)->sharedExtents() : std::nullopt;
    if (extents && extents->bytes > 0) found_.push_back({file, *extents});
  }

  const FileTree& tree_;
  OpenFolders folders_;
  std::span<const FileNumber> files_;
  const TaskGroup& group_;
  Findings& findings_;
  std::map<std::uint32_t, bool> isTold_;
  std::vector<FileSharing> found_;
};

}  // namespace

std::vector<FileSharing> findSharedSpace(const FileTree& tree, std::vector<FileNumber> files,
                                         FileSystem& fileSystem, DiskTurns& turns,
                                         const ScanControl& control) {
  if (control.isCancelled) return {};
  const auto placeOf = [&](FileNumber file) {
    return std::tuple(&tree.diskOf(file), tree.file(file).folder, tree.file(file).inode);
  };
  std::sort(files.begin(), files.end(),
            [&](FileNumber a, FileNumber b) { return placeOf(a) < placeOf(b); });
  Findings findings;
  TaskGroup group(turns, control);
  for (std::span<const FileNumber> rest(files); !rest.empty();) {
    const ScanDisk& disk = tree.diskOf(rest.front());
    const auto end = std::find_if(rest.begin(), rest.end(),
                                  [&](FileNumber file) { return &tree.diskOf(file) != &disk; });
    const auto count = static_cast<std::size_t>(end - rest.begin());
    const std::size_t tasks = disk.isOrdered ? 1 : disk.places;
    const std::size_t length = std::max(worthATask, (count + tasks - 1) / tasks);
    for (std::size_t begin = 0; begin < count; begin += length)
      group.start(disk, std::make_unique<SharingTask>(
                            tree, fileSystem, rest.subspan(begin, std::min(length, count - begin)),
                            group, findings));
    rest = rest.subspan(count);
  }
  group.wait();
  sortByFile(findings.all);
  return std::move(findings.all);
}

}  // namespace Orvane
