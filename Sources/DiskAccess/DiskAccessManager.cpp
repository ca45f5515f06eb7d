// SPDX-License-Identifier: MIT
#include <Varnel/DiskAccess/DiskAccessManager.h>

#include <utility>

#include <Varnel/DiskAccess/DiskAccessState.h>
#include <Varnel/DiskAccess/VolumeChangeRelay.h>
#include <Varnel/Platform/Ports/Ports.h>
#include <Varnel/Platform/Ports/VolumeCatalog.h>

namespace Varnel {
namespace {

DiskAccessManager::Ports portsOf(const Platform::Ports& ports, Basalt::NotificationCenter& center) {
  return {.devices = ports.deviceRegistry,
          .disks = ports.diskArbitration,
          .volumes = ports.volumeCatalog,
          .securityScope = ports.securityScope,
          .notificationCenter = center};
}

/// The process's services, and the relay that tells the default center of its volumes.
struct ProcessServices {
  const Platform::Ports& ports = Platform::processPorts();
  Basalt::NotificationCenter& center = Basalt::NotificationCenter::defaultCenter();
  VolumeChangeRelay relay{ports.volumeCatalog, center};
};

DiskAccessManager::Ports portsOfProcess() {
  static const ProcessServices& services = *new ProcessServices;
  return portsOf(services.ports, services.center);
}

}  // namespace

struct DiskAccessManager::OwnCenter {
  explicit OwnCenter(Platform::VolumeCatalog& volumes) : relay(volumes, center) {}

  Basalt::NotificationCenter center;
  const VolumeChangeRelay relay;
};

DiskAccessManager::DiskAccessManager(Ports ports)
    : state_(std::make_shared<DiskAccessState>(ports)) {
  for (const std::string_view name : {didMountNotification, didUnmountNotification}) {
    notificationCenterObservers_.push_back(ports.notificationCenter.addObserver(
        std::string(name),
        [state = std::weak_ptr<DiskAccessState>(state_)](const Basalt::Notification& change) {
          const auto living = state.lock();
          if (!living) return;
          const auto volume = volumeURLOf(change);
          if (volume && change.name == didUnmountNotification) living->forgetVolume(*volume);
          living->scheduleUpdate();
        }));
  }
  state_->scheduleUpdate();
}

DiskAccessManager::DiskAccessManager() : DiskAccessManager(portsOfProcess()) {}

DiskAccessManager::DiskAccessManager(const Platform::Ports& ports)
    : DiskAccessManager(ports, std::make_shared<OwnCenter>(ports.volumeCatalog)) {}

DiskAccessManager::DiskAccessManager(const Platform::Ports& ports,
                                     std::shared_ptr<OwnCenter> ownCenter)
    : DiskAccessManager(portsOf(ports, ownCenter->center)) {
  ownCenter_ = std::move(ownCenter);
}

DiskAccessManager::~DiskAccessManager() {
  notificationCenterObservers_.clear();
  state_->detachFromPorts();
}

DiskAccessManager& DiskAccessManager::shared() {
  static DiskAccessManager& manager = *new DiskAccessManager;
  return manager;
}

bool DiskAccessManager::isBackgroundMode() const {
  return state_->isBackgroundMode();
}

void DiskAccessManager::setIsBackgroundMode(bool isBackgroundMode) {
  state_->setIsBackgroundMode(isBackgroundMode);
}

std::vector<DiskAccessSnapshot> DiskAccessManager::snapshots() const {
  return state_->snapshots();
}

std::unique_ptr<DiskAccessingSession> DiskAccessManager::beginAccessingURL(
    const Platform::URL& url, std::string propose, Platform::QualityOfService qos,
    bool enableSecureScopedAccess, std::optional<Platform::TimeInterval> accessWaitingTimeout,
    const std::optional<Platform::URL>& volumeURL) {
  const auto begin = [&](const Platform::URL& volume) {
    return state_->begin(state_->recordOfVolume(volume),
                         {.volumeURL = volume,
                          .url = url,
                          .propose = std::move(propose),
                          .qos = qos,
                          .enableSecureScopedAccess = enableSecureScopedAccess,
                          .waitingTimeout = accessWaitingTimeout});
  };
  if (volumeURL) return begin(*volumeURL);
  const auto found = state_->volumes().volumeURL(url);
  return found && *found ? begin(**found) : nullptr;
}

}  // namespace Varnel
