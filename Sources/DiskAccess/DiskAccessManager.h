// SPDX-License-Identifier: MIT
#pragma once

#include <memory>
#include <optional>
#include <string>
#include <vector>

#include <Varnel/Basalt/NotificationCenter.h>
#include <Varnel/DiskAccess/DiskAccessSnapshot.h>
#include <Varnel/DiskAccess/DiskAccessingSession.h>
#include <Varnel/Platform/Api.h>
#include <Varnel/Platform/Values/Date.h>
#include <Varnel/Platform/Values/QualityOfService.h>
#include <Varnel/Platform/Values/URL.h>

namespace Varnel::Platform {
class DeviceRegistry;
class DiskArbitration;
class SecurityScope;
class VolumeCatalog;
struct Ports;
}  // namespace Varnel::Platform

namespace Varnel {

class DiskAccessState;

/// Admits the threads of the process to each physical disk: as many as suit its kind come in at
/// once, the others wait and come in by quality of service. A place that comes free lets in all
/// waiting threads, so under a steady rush there are more readers than that.
///
///     auto session = DiskAccessManager::shared().beginAccessingURL(file, "compare");
///     if (!session) return;  // no access: do not touch the disk
///     read(file);
///     session->endAccessing();
///
/// Any thread. Nothing is reported: a failure is a null session. The disks are known soon after
/// construction and are looked at anew with each mount and unmount; until then, and whenever the
/// manager is too busy to say which disk a volume lies on, a request counts against one record for
/// unknown disks, which admits one thread.
class VARNEL_API DiskAccessManager final {
 public:
  using DiskData = Varnel::DiskData;
  using DiskAccessingSession = Varnel::DiskAccessingSession;

  /// The services that a manager asks, and the center that tells it of mounts and unmounts (see
  /// `VolumeChangeRelay`). They outlive the manager and its sessions.
  struct Ports {
    Platform::DeviceRegistry& devices;
    Platform::DiskArbitration& disks;
    Platform::VolumeCatalog& volumes;
    Platform::SecurityScope& securityScope;
    Basalt::NotificationCenter& notificationCenter;
  };

  /// A manager with the process's services. All throw `std::system_error` when the system grants
  /// no thread for the inventory.
  DiskAccessManager();
  /// One with the services of a set, which hears of volumes from the set's catalogue alone.
  explicit DiskAccessManager(const Platform::Ports& ports);
  explicit DiskAccessManager(Ports ports);

  /// Waits for an inventory that is under way. After that, only sessions that are left use the
  /// ports.
  ~DiskAccessManager();
  DiskAccessManager(const DiskAccessManager&) = delete;
  DiskAccessManager& operator=(const DiskAccessManager&) = delete;

  /// The process's manager, made on first use, which throws as its constructor does, and never
  /// destroyed.
  [[nodiscard]] static DiskAccessManager& shared();

  /// In background mode every disk admits one thread only. Threads that are in stay in.
  [[nodiscard]] bool isBackgroundMode() const;
  void setIsBackgroundMode(bool isBackgroundMode);

  /// The disks on which somebody has a place, or waits for one, at this moment. Waits for an
  /// inventory that is under way. A session that was dropped without its end shows here for ever.
  [[nodiscard]] std::vector<DiskAccessSnapshot> snapshots() const;

  /// Begins access to a file or folder and waits for a place on its disk, at most
  /// `accessWaitingTimeout` seconds of the wall clock. Without a value, or with one that is not a
  /// number or too large for a date, it waits for ever; with a negative one, not at all. A thread
  /// that has a place on the disk gets another at once. If it came to the volume through the record
  /// for unknown disks, it gets the next place there too. `volumeURL` saves the search for the
  /// file's volume; it is written as in the inventory, with a "/" at the end.
  ///
  /// Null when the volume cannot be told, the security scope cannot be opened, or the time is up.
  /// In the last case a security scope that was opened stays open.
  [[nodiscard]] std::unique_ptr<DiskAccessingSession> beginAccessingURL(
      const Platform::URL& url, std::string propose,
      Platform::QualityOfService qos = Platform::QualityOfService::utility,
      bool enableSecureScopedAccess = true,
      std::optional<Platform::TimeInterval> accessWaitingTimeout = {},
      const std::optional<Platform::URL>& volumeURL = {});

 private:
  friend class DiskReadingQueue;
  struct OwnCenter;
  DiskAccessManager(const Platform::Ports& ports, std::shared_ptr<OwnCenter> ownCenter);

  std::shared_ptr<OwnCenter> ownCenter_;  ///< None where the center came with the ports.
  const std::shared_ptr<DiskAccessState> state_;
  std::vector<Basalt::NotificationCenter::Observer> notificationCenterObservers_;
};

}  // namespace Varnel
