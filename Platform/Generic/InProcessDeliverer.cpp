// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Generic/InProcessDeliverer.h>

#include <algorithm>
#include <array>
#include <utility>

#include <Varnel/Platform/Generic/NotificationDeliverer.h>
#include <Varnel/Platform/Ports/MainQueue.h>
#include <Varnel/Platform/Ports/NotificationServer.h>
#include <Varnel/Platform/Ports/PrivateFiles.h>

namespace Varnel::Platform {

// The host of this process, if there is one, and the others as far as they are in front.
class InProcessDeliverer::Hosts final : public NotificationHosts,
                                        public std::enable_shared_from_this<Hosts> {
 public:
  Hosts(PrivateFiles& files, MainQueue& mainQueue, const std::string& storeFile)
      : files_(files),
        mainQueue_(mainQueue),
        frontFiles_{storeFile + ".front", storeFile + ".next"} {}

  std::weak_ptr<NotificationHost> host;

  void setActive(bool isActive) {
    frontLock_.reset();
    for (auto file = frontFiles_.begin(); isActive && !frontLock_ && file != frontFiles_.end();
         ++file)
      if (auto lock = files_.tryLock(*file)) frontLock_ = std::move(*lock);
  }

  void shouldPresent(const UserNotification& notification,
                     std::function<void(bool isToShow)> answer) override {
    const auto asked = host.lock();
    answer(!isAnotherInFront() && (!asked || asked->shouldPresent(notification)));
  }

  // Told later, so that a host that makes its delegate at launch can still subscribe to its events.
  void didDeliver(const UserNotification& notification) override {
    mainQueue_.post([life = weak_from_this(), listener = host, notification] {
      const auto told = listener.lock();
      if (told && !life.expired()) told->didDeliver(notification);
    });
  }

  void didActivate(const NotificationActivation& activation) override {
    if (const auto told = host.lock()) told->didActivate(activation);
  }

 private:
  bool isAnotherInFront() {
    return !frontLock_ &&
           std::any_of(frontFiles_.begin(), frontFiles_.end(), [this](const std::string& file) {
             if (!files_.identity(file)) return false;
             const auto lock = files_.tryLock(file);
             return lock && !*lock;
           });
  }

  PrivateFiles& files_;
  MainQueue& mainQueue_;
  // While the user goes from one process to another, both may be in front for a moment.
  const std::array<std::string, 2> frontFiles_;
  std::unique_ptr<FileLock> frontLock_;
};

InProcessDeliverer::InProcessDeliverer(const DelivererPorts& ports, const std::string& storeFile)
    : hosts_(std::make_shared<Hosts>(ports.privateFiles, ports.mainQueue, storeFile)),
      deliverer_(
          std::make_unique<NotificationDeliverer>(ports, storeFile, Migrating::allowed, *hosts_)),
      server_(ports.notificationServer) {
  // The folder is there from now on, so that somebody may watch it.
  static_cast<void>(ports.privateFiles.prepare(storeFile + ".deliverer"));
}

InProcessDeliverer::~InProcessDeliverer() = default;

void InProcessDeliverer::setHost(std::weak_ptr<NotificationHost> host, Standing) {
  hosts_->host = std::move(host);
  recheck();
}

void InProcessDeliverer::setActive(bool isActive) {
  hosts_->setActive(isActive);
}

void InProcessDeliverer::changed() {
  recheck();
}

void InProcessDeliverer::changedAtOnce() {
  isAskedToDeliver_ = true;
  recheck();
}

void InProcessDeliverer::recheck() {
  using enum NotificationDeliverer::Duty;
  deliverer_->setDuty(!hosts_->host.expired() ? everything : isAskedToDeliver_ ? due : nothing);
}

void InProcessDeliverer::checkBanners(std::function<void(const Failure& obstacle)> answer) {
  server_.check(std::move(answer));
}

bool InProcessDeliverer::isBusy() const {
  return deliverer_->isBusy();
}

}  // namespace Varnel::Platform
