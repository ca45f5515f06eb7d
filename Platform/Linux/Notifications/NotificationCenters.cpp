// SPDX-License-Identifier: MIT
#include <map>
#include <utility>

#include <Varnel/Platform/Generic/DelivererConnection.h>
#include <Varnel/Platform/Generic/HostedApplication.h>
#include <Varnel/Platform/Generic/InProcessDeliverer.h>
#include <Varnel/Platform/Generic/ScheduledNotificationCenter.h>
#include <Varnel/Platform/Linux/Adapters.h>
#include <Varnel/Platform/Linux/MainLoop/FileWatch.h>
#include <Varnel/Platform/POSIX/UserFolders.h>
#include <Varnel/Platform/Ports/Clock.h>
#include <Varnel/Platform/Ports/MainQueue.h>
#include <Varnel/Platform/Ports/NotificationServer.h>
#include <Varnel/Platform/Ports/SystemLog.h>
#include <Varnel/Platform/Ports/TimeZones.h>
#include <Varnel/Platform/Ports/UserLocale.h>
#include <Varnel/Platform/Ports/WallClockTimer.h>

namespace Varnel::Platform::Linux {
namespace {

namespace fs = std::filesystem;

// A deliverer of this process with everything that serves it alone. Other processes of the product
// may change its file, whose folder is there by then; a change of the user's time zone changes the
// link /etc/localtime.
class LocalDeliverer final : public DelivererConnection {
 public:
  LocalDeliverer(const NotificationPorts& ports, const NotificationSource& source,
                 const fs::path& store)
      : server_(makeNotificationServer(ports.systemLog, source)),
        timer_(makeWallClockTimer(ports.systemLog)),
        deliverer_({ports.clock, ports.userLocale, ports.timeZones, ports.mainQueue,
                    ports.privateFiles, ports.systemLog, *server_, *timer_},
                   store.string()),
        storeWatch_(store.parent_path(), store.filename(), [this] { deliverer_.changed(); }),
        zoneWatch_("/etc", "localtime", [this] { deliverer_.changed(); }) {}

  void setHost(std::weak_ptr<NotificationHost> host, Standing standing) override {
    deliverer_.setHost(std::move(host), standing);
  }
  void setActive(bool isActive) override { deliverer_.setActive(isActive); }
  void changed() override { deliverer_.changed(); }
  void changedAtOnce() override { deliverer_.changedAtOnce(); }
  void checkBanners(std::function<void(const Failure&)> answer) override {
    deliverer_.checkBanners(std::move(answer));
  }
  bool isBusy() const override { return deliverer_.isBusy(); }

 private:
  const std::unique_ptr<NotificationServer> server_;
  const std::unique_ptr<WallClockTimer> timer_;
  InProcessDeliverer deliverer_;
  const FileWatch storeWatch_;
  const FileWatch zoneWatch_;
};

// One center with everything that serves it alone. Its folder is there once the center is, so the
// deliverer that may take the notifier's place is made later.
class Center final {
 public:
  Center(const NotificationPorts& ports, const NotificationSource& source, const fs::path& store)
      : connection_(makeNotifierConnection(
            source.identifier, store.string(),
            [=] { return std::make_unique<LocalDeliverer>(ports, source, store); })),
        timer_(makeWallClockTimer(ports.systemLog)),
        center_({ports.clock, ports.userLocale, ports.timeZones, ports.privateFiles,
                 ports.systemLog, *timer_},
                store.string(), source, *connection_) {}

  UserNotificationCenter& center() { return center_; }
  void setActive(bool isActive) { connection_->setActive(isActive); }

 private:
  const std::shared_ptr<DelivererConnection> connection_;
  const std::unique_ptr<WallClockTimer> timer_;
  ScheduledNotificationCenter center_;
};

class StoredCenters final : public UserNotificationCenters {
 public:
  StoredCenters(const NotificationPorts& ports, HostedApplication& application)
      : ports_(ports), application_(application) {
    // What is known is not posted: a program that shows nothing need not run its main queue.
    application.setObserver([&queue = ports.mainQueue, life = std::weak_ptr(life_),
                             wasActive = isActive_](bool isActive) mutable {
      if (std::exchange(wasActive, isActive) == isActive) return;
      queue.post([life, isActive] {
        if (const auto self = life.lock()) (*self)->setActive(isActive);
      });
    });
  }
  ~StoredCenters() override { application_.setObserver(nullptr); }

  UserNotificationCenter& center(const NotificationSource& source) override {
    auto& center = centers_[source.identifier];
    if (!center) {
      center =
          std::make_unique<Center>(ports_, source, POSIX::notificationStore(source.identifier));
      if (isActive_) center->setActive(true);
    }
    return center->center();
  }

 private:
  void setActive(bool isActive) {
    isActive_ = isActive;
    for (const auto& [identifier, center] : centers_) center->setActive(isActive);
  }

  const NotificationPorts ports_;
  HostedApplication& application_;
  bool isActive_ = false;
  std::map<std::string, std::unique_ptr<Center>> centers_;
  const std::shared_ptr<StoredCenters*> life_ = std::make_shared<StoredCenters*>(this);
};

}  // namespace

std::unique_ptr<UserNotificationCenters> makeUserNotificationCenters(
    const NotificationPorts& ports, HostedApplication& application) {
  return std::make_unique<StoredCenters>(ports, application);
}

}  // namespace Varnel::Platform::Linux
