// SPDX-License-Identifier: MIT
#include <Varnel/DiskAccess/DiskData.h>

#include <algorithm>
#include <utility>
#include <vector>

#include <Basalt/SerialQueue.h>
#include <Varnel/DiskAccess/OVDiskInfo.h>

namespace Varnel {
namespace {

std::size_t urgencyClassOf(Platform::QualityOfService qos) {
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

}  // namespace

DiskData::DiskData(std::shared_ptr<const OVDiskInfo> diskInfo, bool isBackgroundMode,
                   std::shared_ptr<Basalt::SerialQueue> queue)
    : diskInfo_(std::move(diskInfo)),
      queue_(std::move(queue)),
      isBackgroundMode_(isBackgroundMode) {}

bool DiskData::hasFreePlace() const {
  const std::int64_t limit = isBackgroundMode_ ? 1 : diskInfo_->maxTreads();
  return static_cast<std::int64_t>(accessingThreads_.count()) < limit;
}

bool DiskData::hasRequests() const {
  return std::any_of(requests_.begin(), requests_.end(),
                     [](const Requests& requests) { return !requests.empty(); });
}

bool DiskData::isIdle() const {
  return accessingThreads_.count() == 0 && !hasRequests();
}

std::shared_ptr<DiskData::AccessRequest> DiskData::requestAccess(Basalt::ThreadID thread,
                                                                 Platform::QualityOfService qos) {
  if (hasFreePlace() || accessingThreads_.contains(thread)) {
    accessingThreads_.insert(thread);
    return nullptr;
  }
  return requests_[urgencyClassOf(qos)].emplace_back(std::make_shared<AccessRequest>());
}

void DiskData::releaseAccess(Basalt::ThreadID thread) {
  accessingThreads_.remove(thread);
  // A request can only join a full disk, whose next release sees it: without any now, there is
  // nothing that a pass could find.
  if (hasRequests()) queue_->submit([self = shared_from_this()] { self->grantPendingRequests(); });
}

void DiskData::grantPendingRequests() {
  Basalt::QNAssertOnQueue(*queue_);
  if (!hasFreePlace()) return;
  Requests granted;
  for (Requests& requests : requests_) {
    for (std::shared_ptr<AccessRequest>& request : requests)
      if (request->claim()) granted.push_back(std::move(request));
    requests.clear();
  }
  if (granted.empty()) return;
  queue_->afterRelease([granted = std::move(granted)] {
    for (const std::shared_ptr<AccessRequest>& request : granted) request->sema.signal();
  });
}

}  // namespace Varnel
