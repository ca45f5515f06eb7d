// SPDX-License-Identifier: MIT
#include <Scan/DiskWork.h>

#include <Scan/DiskTurns.h>

namespace Orvane {
namespace {

/// A second task pays off once this many folders wait for it.
constexpr std::size_t worthATask = 4;

}  // namespace

bool DiskWork::add(const std::vector<Folder*>& folders) {
  const std::lock_guard lock(mutex_);
  for (Folder* folder : folders) pending_.emplace(folder->identity.inode, folder);
  const bool needsTask =
      !pending_.empty() &&
      (tasks_ == 0 || (tasks_ < disk_.places && pending_.size() >= tasks_ * worthATask));
  if (needsTask) ++tasks_;
  return needsTask;
}

Folder* DiskWork::take() {
  const std::lock_guard lock(mutex_);
  if (pending_.empty()) {
    --tasks_;
    return nullptr;
  }
  auto next = pending_.lower_bound({position_, nullptr});
  if (next == pending_.end()) next = pending_.begin();
  Folder* const folder = next->second;
  position_ = next->first;
  pending_.erase(next);
  return folder;
}

}  // namespace Orvane
