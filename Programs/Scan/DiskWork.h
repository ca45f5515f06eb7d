// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <mutex>
#include <set>
#include <utility>
#include <vector>

#include <Scan/FileTree.h>

namespace Orvane {

/// The folders that are left to list at one disk, and how many tasks list them. Any thread.
/// Invariant: while folders are pending, a task is counted.
class DiskWork final {
 public:
  explicit DiskWork(const ScanDisk& disk) : disk_(disk) {}

  [[nodiscard]] const ScanDisk& disk() const { return disk_; }

  /// True when the caller is to start a task, which is counted from now on.
  [[nodiscard]] bool add(const std::vector<Folder*>& folders);

  /// The folder from which the way to all others is short: the next after the last. Null when there
  /// are none, and the task that asked ends.
  [[nodiscard]] Folder* take();

 private:
  const ScanDisk& disk_;
  std::mutex mutex_;                                     ///< Owns what follows.
  std::set<std::pair<std::uint64_t, Folder*>> pending_;  ///< By inode.
  std::uint64_t position_ = 0;                           ///< The inode that was taken last.
  unsigned tasks_ = 0;
};

}  // namespace Orvane
