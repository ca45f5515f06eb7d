// SPDX-License-Identifier: MIT
#pragma once

#include <atomic>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include <Varnel/DiskAccess/DiskAccessManager.h>
#include <Varnel/DiskAccess/InventedIdentifiers.h>

namespace Basalt {
class SecurityScopeBookkeeping;
class SerialQueue;
}  // namespace Basalt

namespace Varnel {

class DiskRecords;

/// What a manager knows and decides; its sessions, the blocks of its planning queue and a reading
/// queue share it, and may outlive the manager. The planning queue owns the records. Any thread
/// calls the operations.
class DiskAccessState final : public std::enable_shared_from_this<DiskAccessState> {
 public:
  using Ports = DiskAccessManager::Ports;

  /// Whom an access is for, and how it waits.
  struct Access {
    Platform::URL volumeURL;
    Platform::URL url;
    std::string propose;
    Platform::QualityOfService qos;
    bool enableSecureScopedAccess;
    std::optional<Platform::TimeInterval> waitingTimeout;
  };

  explicit DiskAccessState(Ports ports);

  [[nodiscard]] Platform::VolumeCatalog& volumes() const { return ports_.volumes; }
  [[nodiscard]] Basalt::NotificationCenter& notificationCenter() const {
    return ports_.notificationCenter;
  }
  [[nodiscard]] Basalt::SecurityScopeBookkeeping& scopes() const { return *scopes_; }
  [[nodiscard]] bool isBackgroundMode() const { return isBackgroundMode_; }
  void setIsBackgroundMode(bool isBackgroundMode);
  void scheduleUpdate();
  void forgetVolume(const Platform::URL& volumeURL);

  /// The record that a volume counts against. The first does not wait, and answers the record for
  /// unknown disks when the planning queue is busy. The second waits for the queue.
  [[nodiscard]] std::shared_ptr<DiskData> recordOfVolume(const Platform::URL& volumeURL);
  [[nodiscard]] std::shared_ptr<DiskData> settledRecordOfVolume(
      const Platform::URL& volumeURL) const;

  /// Null when the volume lies on no known disk. Waits for the planning queue.
  [[nodiscard]] std::shared_ptr<const OVDiskInfo> knownDiskOfVolume(
      const Platform::URL& volumeURL) const;

  /// What the disk is called among processes that share its places; absent when another process
  /// would call it otherwise, as the identifier is invented. Waits for the planning queue, as all
  /// three.
  [[nodiscard]] std::optional<std::string> sharedNameOf(const DiskData& record) const;
  void setWaitsForProcesses(const std::shared_ptr<DiskData>& record, int urgencyClass,
                            bool waits) const;
  [[nodiscard]] std::vector<DiskAccessSnapshot> snapshots() const;

  /// Null when the security scope cannot be opened or the time is up.
  [[nodiscard]] std::unique_ptr<DiskAccessingSession> begin(std::shared_ptr<DiskData> record,
                                                            Access access);

  /// From now on no inventory is taken.
  void detachFromPorts();

 private:
  void updateDiskDataUnsafe();

  const Ports ports_;
  const std::shared_ptr<Basalt::SecurityScopeBookkeeping> scopes_;
  const std::shared_ptr<Basalt::SerialQueue> planningQueue_;
  const std::shared_ptr<DiskData> unknownDiskData_;
  const std::shared_ptr<DiskRecords> records_;
  std::atomic<bool> isBackgroundMode_ = false;
  std::atomic<bool> isUpdateQueued_ = false;  ///< True until the update begins.
  InventedIdentifiers identifiers_;           ///< The planning queue owns it, and what follows.
  bool isDetached_ = false;
};

}  // namespace Varnel
