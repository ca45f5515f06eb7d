// SPDX-License-Identifier: MIT
#pragma once

#include <functional>
#include <memory>

#include <Varnel/Platform/Api.h>

namespace Gio {
class Application;
}

namespace Varnel {
class UserNotificationRouter;
}

namespace Varnel::Platform {
struct Ports;
}

namespace Varnel::GTK3 {

/// Makes the router of notifications when the application starts up, which only its first instance
/// does: a second one, which passes its command line on and ends, never listens.
///
///     auto application = Gtk::Application::create("com.example.Fotovia");
///     GTK3::RouterAtStartup routing(*application, [&](UserNotificationRouter& router) {
///       reminders.emplace(tracker, router);
///       router.register_("SchedulerNotification", [&](const auto& notification, auto kind) { … });
///     });
///     return application->run();
///
/// What the application was started for (a click on a reminder while it did not run) is routed once
/// the function has subscribed. Main thread only. It outlives the run of the application.
class VARNEL_API RouterAtStartup final {
 public:
  using Subscribe = std::function<void(UserNotificationRouter& router)>;

  RouterAtStartup(Gio::Application& application, Subscribe subscribe);
  /// The same with a set of ports, which outlive this.
  RouterAtStartup(Gio::Application& application, const Platform::Ports& ports, Subscribe subscribe);
  ~RouterAtStartup();
  RouterAtStartup(const RouterAtStartup&) = delete;
  RouterAtStartup& operator=(const RouterAtStartup&) = delete;

  /// Null before the start-up, and in an instance that is not the first.
  [[nodiscard]] UserNotificationRouter* router() const;

 private:
  class Start;

  const std::unique_ptr<Start> start_;
};

}  // namespace Varnel::GTK3
