// SPDX-License-Identifier: MIT
#include <Varnel/DiskAccess/DiskAccessState.h>

#include <utility>

#include <Varnel/Basalt/Digest.h>
#include <Varnel/Basalt/SecurityScopeBookkeeping.h>
#include <Varnel/Basalt/SerialQueue.h>
#include <Varnel/DiskAccess/DiskData.h>
#include <Varnel/DiskAccess/DiskInventory.h>
#include <Varnel/DiskAccess/DiskRecords.h>
#include <Varnel/DiskAccess/OVDiskInfo.h>

namespace Varnel {
namespace {

/// A look-up of a volume's record: the question and, later, the answer. The asking thread does not
/// wait; it reads the answer if there is one.
struct RecordLookup {
  explicit RecordLookup(Platform::URL url) : volumeURL(std::move(url)) {}

  const Platform::URL volumeURL;
  std::shared_ptr<DiskData> record;  ///< To be read once `isAnswered` is true.
  std::atomic<bool> isAnswered = false;
};

}  // namespace

DiskAccessState::DiskAccessState(Ports ports)
    : ports_(ports),
      scopes_(std::make_shared<Basalt::SecurityScopeBookkeeping>(ports.securityScope)),
      planningQueue_(Basalt::QNBuildInternalDispatchQueue("disk-access-manager.planning-queue")),
      unknownDiskData_(std::make_shared<DiskData>(
          std::make_shared<OVDiskInfo>("unknown", OVDiskInfo::VolumeURLs(), OVDiskKindUnknown),
          false, planningQueue_)),
      records_(std::make_shared<DiskRecords>(planningQueue_)) {}

void DiskAccessState::scheduleUpdate() {
  // An inventory that has not begun yet will see this change too.
  if (isUpdateQueued_.exchange(true)) return;
  planningQueue_->async([self = shared_from_this()] {
    self->isUpdateQueued_.exchange(false);
    self->updateDiskDataUnsafe();
  });
}

void DiskAccessState::forgetVolume(const Platform::URL& volumeURL) {
  planningQueue_->submit(
      [self = shared_from_this(), volumeURL] { self->identifiers_.forget(volumeURL); });
}

void DiskAccessState::detachFromPorts() {
  if (planningQueue_->isCurrent())
    isDetached_ = true;
  else
    planningQueue_->sync([this] { isDetached_ = true; });
}

void DiskAccessState::updateDiskDataUnsafe() {
  Basalt::QNAssertOnQueue(*planningQueue_);
  if (isDetached_) return;
  records_->update(
      DiskInventory::take(
          {.devices = ports_.devices, .disks = ports_.disks, .volumes = ports_.volumes},
          identifiers_),
      isBackgroundMode_);
}

void DiskAccessState::setIsBackgroundMode(bool isBackgroundMode) {
  isBackgroundMode_ = isBackgroundMode;
  planningQueue_->async([self = shared_from_this(), isBackgroundMode] {
    self->records_->setIsBackgroundMode(isBackgroundMode);
  });
}

std::shared_ptr<DiskData> DiskAccessState::settledRecordOfVolume(
    const Platform::URL& volumeURL) const {
  auto record = planningQueue_->sync([&] { return records_->ofVolume(volumeURL); });
  return record ? record : unknownDiskData_;
}

std::shared_ptr<const OVDiskInfo> DiskAccessState::knownDiskOfVolume(
    const Platform::URL& volumeURL) const {
  const auto record = settledRecordOfVolume(volumeURL);
  return record == unknownDiskData_ ? nullptr : record->diskInfo();
}

std::optional<std::string> DiskAccessState::sharedNameOf(const DiskData& record) const {
  const auto& identifier = record.diskInfo()->uniqueID();
  if (&record == unknownDiskData_.get() || !identifier || identifier->empty()) return std::nullopt;
  const bool isInvented =
      planningQueue_->sync([&] { return identifiers_.hasInvented(*identifier); });
  if (isInvented) return std::nullopt;
  // A serial number may hold any characters, and be long.
  return Basalt::hexadecimal(Basalt::sha256(*identifier));
}

void DiskAccessState::setWaitsForProcesses(const std::shared_ptr<DiskData>& record,
                                           int urgencyClass, bool waits) const {
  planningQueue_->sync([&] {
    if (waits)
      records_->addWaiterForProcesses(record, urgencyClass);
    else
      records_->removeWaiterForProcesses(record, urgencyClass);
  });
}

std::vector<DiskAccessSnapshot> DiskAccessState::snapshots() const {
  return planningQueue_->sync([&] { return records_->snapshots(); });
}

std::shared_ptr<DiskData> DiskAccessState::recordOfVolume(const Platform::URL& volumeURL) {
  const auto lookup = std::make_shared<RecordLookup>(volumeURL);
  planningQueue_->submit([self = shared_from_this(), lookup] {
    lookup->record = self->records_->ofVolume(lookup->volumeURL);
    lookup->isAnswered.store(true, std::memory_order_release);
  });
  const bool isKnown = lookup->isAnswered.load(std::memory_order_acquire) && lookup->record;
  return isKnown ? lookup->record : unknownDiskData_;
}

std::unique_ptr<DiskAccessingSession> DiskAccessState::begin(std::shared_ptr<DiskData> record,
                                                             Access access) {
  auto session = std::make_unique<DiskAccessingSession>(
      std::move(access.url), std::move(access.propose), access.enableSecureScopedAccess,
      std::move(record), std::move(access.volumeURL), records_, scopes_);
  if (!session->beginAccessing(access.qos, access.waitingTimeout)) return nullptr;
  return session;
}

}  // namespace Varnel
