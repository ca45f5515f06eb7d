// SPDX-License-Identifier: MIT
#include <map>

#include <Varnel/Platform/Generic/InProcessDeliverer.h>
#include <Varnel/Platform/Generic/ScheduledNotificationCenter.h>
#include <Varnel/Platform/Linux/Adapters.h>
#include <Varnel/Platform/Linux/MainLoop/FileWatch.h>
#include <Varnel/Platform/Linux/Process/UserFolders.h>
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
class LocalDeliverer final {
 public:
  LocalDeliverer(const NotificationPorts& ports, const NotificationSource& source,
                 const fs::path& store)
      : server_(makeNotificationServer(ports.systemLog, source, makeSessionBus())),
        timer_(makeWallClockTimer(ports.systemLog)),
        deliverer_({ports.clock, ports.userLocale, ports.timeZones, ports.mainQueue,
                    ports.privateFiles, ports.systemLog, *server_, *timer_},
                   store.string()),
        storeWatch_(store.parent_path(), store.filename(), [this] { deliverer_.changed(); }),
        zoneWatch_("/etc", "localtime", [this] { deliverer_.changed(); }) {}

  DelivererConnection& connection() { return deliverer_; }

 private:
  const std::unique_ptr<NotificationServer> server_;
  const std::unique_ptr<WallClockTimer> timer_;
  InProcessDeliverer deliverer_;
  const FileWatch storeWatch_;
  const FileWatch zoneWatch_;
};

// One center with everything that serves it alone.
class Center final {
 public:
  Center(const NotificationPorts& ports, const NotificationSource& source, const fs::path& store)
      : deliverer_(ports, source, store),
        timer_(makeWallClockTimer(ports.systemLog)),
        center_({ports.clock, ports.userLocale, ports.timeZones, ports.privateFiles,
                 ports.systemLog, *timer_},
                store.string(), source, deliverer_.connection()) {}

  UserNotificationCenter& center() { return center_; }

 private:
  LocalDeliverer deliverer_;
  const std::unique_ptr<WallClockTimer> timer_;
  ScheduledNotificationCenter center_;
};

class StoredCenters final : public UserNotificationCenters {
 public:
  explicit StoredCenters(const NotificationPorts& ports) : ports_(ports) {}

  UserNotificationCenter& center(const NotificationSource& source) override {
    auto& center = centers_[source.identifier];
    if (!center)
      center = std::make_unique<Center>(ports_, source, notificationStore(source.identifier));
    return center->center();
  }

 private:
  const NotificationPorts ports_;
  std::map<std::string, std::unique_ptr<Center>> centers_;
};

}  // namespace

std::unique_ptr<UserNotificationCenters> makeUserNotificationCenters(
    const NotificationPorts& ports) {
  return std::make_unique<StoredCenters>(ports);
}

}  // namespace Varnel::Platform::Linux
