// SPDX-License-Identifier: MIT
#include <Varnel/DiskAccess/DiskData.h>

#include <algorithm>
#include <utility>

#include <Varnel/Basalt/SerialQueue.h>
#include <Varnel/DiskAccess/OVDiskInfo.h>

namespace Varnel {

int urgencyClassOf(Platform::QualityOfService qos) {
  switch (qos) {
    case Platform::QualityOfService::userInteractive:
      return 0;
    case Platform::QualityOfService::userInitiated:
    case Platform::QualityOfService::default_:
      return 1;
    case Platform::QualityOfService::utility:
      return 2;
    case Platform::QualityOfService::background:
      return 3;
  }
  return 0;
}

DiskData::DiskData(std::shared_ptr<const OVDiskInfo> diskInfo, bool isBackgroundMode,
                   std::shared_ptr<Basalt::SerialQueue> queue)
    : queue_(std::move(queue)),
      diskInfo_(std::move(diskInfo)),
      maxThreads_(diskInfo_->maxTreads()),
      isBackgroundMode_(isBackgroundMode) {}

std::shared_ptr<DiskData::AccessRequest> DiskData::requestAccess(Basalt::ThreadID thread,
                                                                 Platform::QualityOfService qos) {
  if (hasFreePlace() || accessingThreads_.contains(thread)) {
    accessingThreads_.insert(thread);
    return nullptr;
  }
  // Requests of threads that gave up must not pile up while a disk stays full.
  if (requests_.size() == requests_.capacity())
    std::erase_if(requests_, [](const auto& other) { return other->isClaimed(); });
  return requests_.emplace_back(std::make_shared<AccessRequest>(urgencyClassOf(qos)));
}

void DiskData::releaseAccess(Basalt::ThreadID thread) {
  accessingThreads_.remove(thread);
  // A request joins only a full disk, and the disk's next release sees it. So if there is none now,
  // a pass has nothing to do.
  if (requests_.empty()) [[likely]]
    return;
  // What was submitted before comes first: it may change how many places there are.
  if (queue_->hasSubmittedBlocks())
    queue_->submit([self = shared_from_this()] { self->grantPendingRequests(); });
  else
    grantPendingRequests();
}

// Out of line, so that a release which nobody waits for stays short.
[[gnu::noinline]] void DiskData::grantPendingRequests() {
  Basalt::QNAssertOnQueue(*queue_);
  if (!hasFreePlace()) return;
  Requests granted = claimPendingRequests();
  if (granted.empty()) return;
  queue_->afterRelease([granted = std::move(granted)] {
    for (const std::shared_ptr<AccessRequest>& request : granted) request->sema.signal();
  });
}

std::array<std::size_t, urgencyClassCount> DiskData::waiterCounts() const {
  std::array<std::size_t, urgencyClassCount> counts{};
  for (const auto& request : requests_)
    if (!request->isClaimed()) ++counts[static_cast<std::size_t>(request->urgencyClass())];
  return counts;
}

DiskData::Requests DiskData::claimPendingRequests() {
  Requests granted = std::exchange(requests_, {});
  std::erase_if(granted, [](const auto& request) { return !request->claim(); });
  // One alone needs no room for sorting.
  if (granted.size() > 1)
    std::stable_sort(granted.begin(), granted.end(), [](const auto& one, const auto& other) {
      return one->urgencyClass() < other->urgencyClass();
    });
  return granted;
}

}  // namespace Varnel
