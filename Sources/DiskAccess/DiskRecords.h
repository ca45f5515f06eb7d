// SPDX-License-Identifier: MIT
#pragma once

#include <memory>
#include <string>
#include <unordered_map>
#include <utility>
#include <vector>

#include <Varnel/Basalt/ThreadID.h>
#include <Varnel/DiskAccess/DiskAccessSnapshot.h>
#include <Varnel/DiskAccess/OVDiskInfo.h>
#include <Varnel/Platform/Values/URL.h>

namespace Basalt {
class SerialQueue;
}

namespace Varnel {

class DiskData;

/// The records of a manager's disks, and which thread uses which of them for which volume.
///
/// The queue owns it: all operations run there.
class DiskRecords final {
 public:
  explicit DiskRecords(std::shared_ptr<Basalt::SerialQueue> queue) : queue_(std::move(queue)) {}

  /// Follows an inventory. A disk that stays keeps its record. The record of a disk that is gone is
  /// kept while a thread uses it or waits for it.
  void update(const OVDiskInfo::Array& disks, bool isBackgroundMode);

  void setIsBackgroundMode(bool isBackgroundMode);

  /// The record of the disk that holds the volume; null when it is not known.
  [[nodiscard]] std::shared_ptr<DiskData> ofVolume(const Platform::URL& volumeURL) const;

  /// A record on which the thread has a place for a volume of the same disk, this one or another;
  /// null when there is none. A thread that nests accesses to a disk uses this record. For another
  /// it could wait for ever: the thread in front of it may wait for the place that it has here.
  [[nodiscard]] std::shared_ptr<DiskData> usedBy(Basalt::ThreadID thread,
                                                 const Platform::URL& volumeURL) const;

  /// A place that a record has given to a thread, and the volume that it is for.
  struct Use {
    Basalt::ThreadID thread;
    std::shared_ptr<DiskData> record;
    Platform::URL volumeURL;
    std::string propose{};
    DiskAccessSnapshot::Time since{};
  };

  /// Takes over a use that was made before there was a place for it: what a woken thread does here
  /// keeps it from its disk.
  void add(std::unique_ptr<Use> use) { uses_.push_back(std::move(use)); }

  /// Hands out one such use or, if there is none, any other use of the record by the thread. So the
  /// thread stands here as often as the record counts it. Destroy it once others have been woken.
  std::unique_ptr<Use> remove(Basalt::ThreadID thread, const std::shared_ptr<DiskData>& record,
                              const Platform::URL& volumeURL);

  /// A thread of a class waits for a place that other processes have, or has stopped waiting.
  void addWaiterForProcesses(std::shared_ptr<DiskData> record, int urgencyClass);
  void removeWaiterForProcesses(const std::shared_ptr<DiskData>& record, int urgencyClass);

  /// The disks on which somebody has a place or waits for one.
  [[nodiscard]] std::vector<DiskAccessSnapshot> snapshots() const;

 private:
  using WaiterForProcesses = std::pair<std::shared_ptr<DiskData>, int>;

  const std::shared_ptr<Basalt::SerialQueue> queue_;
  std::unordered_map<Platform::URL, std::string> diskUniqueIDsByVolumeURL_;
  std::unordered_map<std::string, std::shared_ptr<DiskData>> diskDataByUniqueID_;
  std::vector<std::unique_ptr<Use>> uses_;  ///< In the order in which the places were taken.
  std::vector<WaiterForProcesses> waitersForProcesses_;
};

}  // namespace Varnel
