// SPDX-License-Identifier: MIT
#include <Varnel/DiskAccess/DiskRecords.h>

#include <algorithm>
#include <utility>

#include <Varnel/Basalt/SerialQueue.h>
#include <Varnel/DiskAccess/DiskData.h>

namespace Varnel {

void DiskRecords::update(const OVDiskInfo::Array& disks, bool isBackgroundMode) {
  Basalt::QNAssertOnQueue(*queue_);
  diskUniqueIDsByVolumeURL_.clear();
  std::unordered_map<std::string, std::shared_ptr<DiskData>> records;
  for (const auto& disk : disks) {
    if (!disk->uniqueID() || !disk->volumeURLs() || disk->volumeURLs()->empty()) continue;
    std::shared_ptr<DiskData>& record = records[*disk->uniqueID()];
    if (const auto known = diskDataByUniqueID_.find(*disk->uniqueID());
        known != diskDataByUniqueID_.end())
      record = known->second;
    else if (!record)
      record = std::make_shared<DiskData>(disk, isBackgroundMode, queue_);
    for (const Platform::URL& volumeURL : *disk->volumeURLs())
      diskUniqueIDsByVolumeURL_[volumeURL] = *disk->uniqueID();
  }
  // Each use holds its record, and so does the session of a thread that waits or was just woken.
  for (auto& [uniqueID, record] : diskDataByUniqueID_)
    if (record.use_count() > 1) records.try_emplace(uniqueID, std::move(record));
  diskDataByUniqueID_ = std::move(records);
}

void DiskRecords::setIsBackgroundMode(bool isBackgroundMode) {
  for (const auto& [uniqueID, record] : diskDataByUniqueID_) {
    record->setIsBackgroundMode(isBackgroundMode);
    if (!isBackgroundMode) record->grantPendingRequests();
  }
}

std::shared_ptr<DiskData> DiskRecords::ofVolume(const Platform::URL& volumeURL) const {
  const auto uniqueID = diskUniqueIDsByVolumeURL_.find(volumeURL);
  if (uniqueID == diskUniqueIDsByVolumeURL_.end()) return nullptr;
  const auto record = diskDataByUniqueID_.find(uniqueID->second);
  return record == diskDataByUniqueID_.end() ? nullptr : record->second;
}

std::shared_ptr<DiskData> DiskRecords::usedBy(Basalt::ThreadID thread,
                                              const Platform::URL& volumeURL) const {
  const auto isOfItsDisk = [&](const Use& use) {
    // The inventory may know of volumes that the disk did not have when its record was made, and
    // the record of volumes that are gone.
    const auto& volumes = use.record->diskInfo()->volumeURLs();
    if (volumes && volumes->contains(volumeURL)) return true;
    const auto disk = ofVolume(volumeURL);
    return disk && (disk == use.record || disk == ofVolume(use.volumeURL));
  };
  for (const auto& use : uses_)
    if (use->thread == thread && (use->volumeURL == volumeURL || isOfItsDisk(*use)))
      return use->record;
  return nullptr;
}

std::unique_ptr<DiskRecords::Use> DiskRecords::remove(Basalt::ThreadID thread,
                                                      const std::shared_ptr<DiskData>& record,
                                                      const Platform::URL& volumeURL) {
  auto found = uses_.end();
  for (auto use = uses_.begin(); use != uses_.end(); ++use) {
    if ((*use)->thread != thread || (*use)->record != record) continue;
    found = use;
    if ((*use)->volumeURL == volumeURL) break;
  }
  if (found == uses_.end()) return nullptr;
  auto removed = std::move(*found);
  uses_.erase(found);
  return removed;
}

void DiskRecords::addWaiterForProcesses(std::shared_ptr<DiskData> record, int urgencyClass) {
  waitersForProcesses_.emplace_back(std::move(record), urgencyClass);
}

void DiskRecords::removeWaiterForProcesses(const std::shared_ptr<DiskData>& record,
                                           int urgencyClass) {
  const auto found = std::find(waitersForProcesses_.begin(), waitersForProcesses_.end(),
                               WaiterForProcesses(record, urgencyClass));
  if (found != waitersForProcesses_.end()) waitersForProcesses_.erase(found);
}

std::vector<DiskAccessSnapshot> DiskRecords::snapshots() const {
  Basalt::QNAssertOnQueue(*queue_);
  std::vector<DiskAccessSnapshot> snapshots;
  std::unordered_map<const DiskData*, std::size_t> indices;
  // A record on which nobody is has nobody waiting either, but for what other processes have.
  const auto snapshotOf = [&](const DiskData& record) -> DiskAccessSnapshot& {
    const auto [index, isNew] = indices.try_emplace(&record, snapshots.size());
    if (isNew)
      snapshots.push_back({.disk = record.diskInfo(),
                           .maxReaders = record.maxThreads(),
                           .waiters = record.waiterCounts()});
    return snapshots[index->second];
  };
  for (const auto& use : uses_)
    snapshotOf(*use->record).places.push_back({use->thread, use->propose, use->since});
  for (const auto& [record, urgencyClass] : waitersForProcesses_)
    ++snapshotOf(*record).waitersForProcesses[static_cast<std::size_t>(urgencyClass)];
  return snapshots;
}

}  // namespace Varnel
