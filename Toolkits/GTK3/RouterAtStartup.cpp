// SPDX-License-Identifier: MIT
#include <Varnel/GTK3/RouterAtStartup.h>
#include <Varnel/Platform/Ports/Ports.h>
#include <Varnel/Platform/Ports/UserNotificationCenter.h>
#include <Varnel/Reminders/UserNotificationRouter.h>
#include <giomm/application.h>
#include <sigc++/sigc++.h>

#include <optional>
#include <utility>

namespace Varnel::GTK3 {

class RouterAtStartup::Start final : public sigc::trackable {
 public:
  Start(Gio::Application& application, const Platform::Ports& ports, Subscribe subscribe)
      : ports_(ports), subscribe_(std::move(subscribe)) {
    application.signal_startup().connect(sigc::mem_fun(*this, &Start::begin));
  }

  [[nodiscard]] UserNotificationRouter* router() { return router_ ? &*router_ : nullptr; }

 private:
  void begin() {
    router_.emplace(ports_);
    if (subscribe_) subscribe_(*router_);
    const auto launch = router_->userNotificationCenter().takeLaunchNotification();
    if (launch && *launch) router_->handleLaunch(**launch);
  }

  const Platform::Ports& ports_;
  const Subscribe subscribe_;
  std::optional<UserNotificationRouter> router_;
};

RouterAtStartup::RouterAtStartup(Gio::Application& application, Subscribe subscribe)
    : RouterAtStartup(application, Platform::processPorts(), std::move(subscribe)) {}

RouterAtStartup::RouterAtStartup(Gio::Application& application, const Platform::Ports& ports,
                                 Subscribe subscribe)
    : start_(std::make_unique<Start>(application, ports, std::move(subscribe))) {}

RouterAtStartup::~RouterAtStartup() = default;

UserNotificationRouter* RouterAtStartup::router() const {
  return start_->router();
}

}  // namespace Varnel::GTK3
