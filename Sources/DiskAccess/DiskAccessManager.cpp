// SPDX-License-Identifier: MIT
#include <Varnel/DiskAccess/DiskAccessManager.h>

#include <atomic>
#include <utility>

#include <Varnel/Basalt/SecurityScopeBookkeeping.h>
#include <Varnel/Basalt/SerialQueue.h>
#include <Varnel/DiskAccess/DiskData.h>
#include <Varnel/DiskAccess/DiskRecords.h>
#include <Varnel/DiskAccess/OVDiskInfo.h>
#include <Varnel/DiskAccess/VolumeChangeRelay.h>
#include <Varnel/Platform/Ports/Ports.h>
#include <Varnel/Platform/Ports/VolumeCatalog.h>

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

/// The process's services, and the relay that tells the default center of its volumes.
struct ProcessServices {
  const Platform::Ports& ports = Platform::processPorts();
  Basalt::NotificationCenter& center = Basalt::NotificationCenter::defaultCenter();
  VolumeChangeRelay relay{ports.volumeCatalog, center};
};

DiskAccessManager::Ports portsOfProcess() {
  static const ProcessServices& services = *new ProcessServices;
  return {.devices = services.ports.deviceRegistry,
          .disks = services.ports.diskArbitration,
          .volumes = services.ports.volumeCatalog,
          .securityScope = services.ports.securityScope,
          .notificationCenter = services.center};
}

}  // namespace

/// The state that blocks of the planning queue share with the manager. The queue owns it, except
/// for the members that say otherwise.
class DiskAccessManager::State final : public std::enable_shared_from_this<State> {
 public:
  explicit State(Ports ports)
      : ports_(ports),
        scopes_(std::make_shared<Basalt::SecurityScopeBookkeeping>(ports.securityScope)),
        planningQueue_(Basalt::QNBuildInternalDispatchQueue("disk-access-manager.planning-queue")),
        unknownDiskData_(std::make_shared<DiskData>(
            std::make_shared<OVDiskInfo>("unknown", OVDiskInfo::VolumeURLs(), OVDiskKindUnknown),
            false, planningQueue_)),
        records_(std::make_shared<DiskRecords>(planningQueue_)) {}

  // Any thread.
  [[nodiscard]] Platform::VolumeCatalog& volumes() const { return ports_.volumes; }
  [[nodiscard]] const auto& scopes() const { return scopes_; }
  [[nodiscard]] const auto& records() const { return records_; }
  [[nodiscard]] bool isBackgroundMode() const { return isBackgroundMode_; }
  void setIsBackgroundMode(bool isBackgroundMode);
  void scheduleUpdate();
  [[nodiscard]] std::shared_ptr<DiskData> recordOfVolume(const Platform::URL& volumeURL);
  void detachFromPorts();

 private:
  void updateDiskDataUnsafe();

  const Ports ports_;
  const std::shared_ptr<Basalt::SecurityScopeBookkeeping> scopes_;
  const std::shared_ptr<Basalt::SerialQueue> planningQueue_;
  const std::shared_ptr<DiskData> unknownDiskData_;
  std::atomic<bool> isBackgroundMode_ = false;
  std::atomic<bool> isUpdateQueued_ = false;  ///< True until the update begins.

  const std::shared_ptr<DiskRecords> records_;
  bool isDetached_ = false;
};

void DiskAccessManager::State::scheduleUpdate() {
  // An inventory that has not begun yet will see this change too.
  if (isUpdateQueued_.exchange(true)) return;
  planningQueue_->async([self = shared_from_this()] {
    self->isUpdateQueued_.exchange(false);
    self->updateDiskDataUnsafe();
  });
}

void DiskAccessManager::State::detachFromPorts() {
  if (planningQueue_->isCurrent())
    isDetached_ = true;
  else
    planningQueue_->sync([this] { isDetached_ = true; });
}

void DiskAccessManager::State::updateDiskDataUnsafe() {
  Basalt::QNAssertOnQueue(*planningQueue_);
  if (isDetached_) return;
  records_->update(
      OVDiskInfo::allDiskInfos(
          {.devices = ports_.devices, .disks = ports_.disks, .volumes = ports_.volumes}),
      isBackgroundMode_);
}

void DiskAccessManager::State::setIsBackgroundMode(bool isBackgroundMode) {
  isBackgroundMode_ = isBackgroundMode;
  planningQueue_->async([self = shared_from_this(), isBackgroundMode] {
    self->records_->setIsBackgroundMode(isBackgroundMode);
  });
}

std::shared_ptr<DiskData> DiskAccessManager::State::recordOfVolume(const Platform::URL& volumeURL) {
  const auto lookup = std::make_shared<RecordLookup>(volumeURL);
  planningQueue_->submit([self = shared_from_this(), lookup] {
    lookup->record = self->records_->ofVolume(lookup->volumeURL);
    lookup->isAnswered.store(true, std::memory_order_release);
  });
  const bool isKnown = lookup->isAnswered.load(std::memory_order_acquire) && lookup->record;
  return isKnown ? lookup->record : unknownDiskData_;
}

DiskAccessManager::DiskAccessManager() : DiskAccessManager(portsOfProcess()) {}

DiskAccessManager::DiskAccessManager(Ports ports) : state_(std::make_shared<State>(ports)) {
  for (const std::string_view name : {didMountNotification, didUnmountNotification}) {
    notificationCenterObservers_.push_back(ports.notificationCenter.addObserver(
        std::string(name), [state = std::weak_ptr<State>(state_)](const Basalt::Notification&) {
          if (const auto living = state.lock()) living->scheduleUpdate();
        }));
  }
  state_->scheduleUpdate();
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

std::unique_ptr<DiskAccessingSession> DiskAccessManager::beginAccessingURL(
    const Platform::URL& url, std::string propose, Platform::QualityOfService qos,
    bool enableSecureScopedAccess, std::optional<Platform::TimeInterval> accessWaitingTimeout,
    const std::optional<Platform::URL>& volumeURL) {
  const auto begin = [&](const Platform::URL& volume) {
    return beginAccessingVolume(volume, std::move(propose), url, qos, enableSecureScopedAccess,
                                accessWaitingTimeout);
  };
  if (volumeURL) return begin(*volumeURL);
  const auto found = state_->volumes().volumeURL(url);
  return found && *found ? begin(**found) : nullptr;
}

std::unique_ptr<DiskAccessingSession> DiskAccessManager::beginAccessingVolume(
    const Platform::URL& volumeURL, std::string propose, const Platform::URL& url,
    Platform::QualityOfService qos, bool enableSecureScopedAccess,
    std::optional<Platform::TimeInterval> accessWaitingTimeout) {
  auto session = std::make_unique<DiskAccessingSession>(
      url, std::move(propose), enableSecureScopedAccess, state_->recordOfVolume(volumeURL),
      volumeURL, state_->records(), state_->scopes());
  if (!session->beginAccessing(qos, accessWaitingTimeout)) return nullptr;
  return session;
}

}  // namespace Varnel
