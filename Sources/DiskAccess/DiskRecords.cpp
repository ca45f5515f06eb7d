// SPDX-License-Identifier: MIT
#include <Varnel/DiskAccess/DiskRecords.h>

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
  for (const Use& use : uses_)
    if (use.thread == thread && (use.volumeURL == volumeURL || isOfItsDisk(use))) return use.record;
  return nullptr;
}

void DiskRecords::remove(Basalt::ThreadID thread, const std::shared_ptr<DiskData>& record,
                         const Platform::URL& volumeURL) {
  auto found = uses_.end();
  for (auto use = uses_.begin(); use != uses_.end(); ++use) {
    if (use->thread != thread || use->record != record) continue;
    found = use;
    if (use->volumeURL == volumeURL) break;
  }
  if (found != uses_.end()) uses_.erase(found);
}

}  // namespace Varnel
