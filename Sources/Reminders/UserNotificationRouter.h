// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <functional>
#include <memory>
#include <optional>
#include <string>

#include <Varnel/Basalt/Channel.h>
#include <Varnel/Platform/Api.h>
#include <Varnel/Platform/Ports/UserNotificationCenter.h>
#include <Varnel/Platform/Values/PlatformError.h>
#include <Varnel/Platform/Values/UserNotification.h>

namespace Varnel::Platform {
class Application;
class MainQueue;
struct Ports;
}  // namespace Varnel::Platform

namespace Varnel {

/// The one delegate of the notification center: passes its events on to those that registered for a
/// notification's identifier.
///
///     UserNotificationRouter router;  // at launch, before any notification can arrive
///     router.register_("com.example.daily", [](const auto& notification, auto kind) { … });
///
/// `register_` and `channel` may be called on any thread, all else on the main thread. Handlers run
/// on the main queue, never within the call that caused the event. An event for which nobody has
/// registered is lost.
class VARNEL_API UserNotificationRouter final {
 public:
  enum class EventKind : std::int64_t {
    didLaunchWith,  ///< The user launched the application through the notification.
    didDeliver,
    didActivate,  ///< The user clicked the notification or its action button.
  };
  /// The kind of a raw value from 0 to 2.
  [[nodiscard]] static std::optional<EventKind> eventKindWithRawValue(std::int64_t rawValue);

  struct Event {
    Platform::UserNotification notification;
    EventKind kind;
  };
  using Handler = std::function<void(const Platform::UserNotification&, EventKind)>;

  using Standing = Platform::UserNotificationCenter::Standing;

  struct Ports {
    Platform::UserNotificationCenter& userNotificationCenter;
    Platform::Application& application;
    Platform::MainQueue& mainQueue;
  };

  /// Becomes the delegate of the center, which then delivers the notifications that came due.
  explicit UserNotificationRouter(Ports ports, Standing standing = Standing::application);
  /// The running application's own center in a set.
  explicit UserNotificationRouter(const Platform::Ports& ports);
  /// The router of the running application's own center.
  UserNotificationRouter();
  ~UserNotificationRouter();
  UserNotificationRouter(const UserNotificationRouter&) = delete;
  UserNotificationRouter& operator=(const UserNotificationRouter&) = delete;

  /// The center that `UserNotificationRouter()` serves, for reading it without listening.
  [[nodiscard]] static Platform::UserNotificationCenter& defaultUserNotificationCenter();

  [[nodiscard]] Platform::UserNotificationCenter& userNotificationCenter() const;

  /// Subscribes to all events of notifications with this identifier, for the router's life.
  void register_(const std::string& identifier, Handler handler);

  /// The events of notifications with this identifier.
  [[nodiscard]] Basalt::Channel<Event> channel(const std::string& identifier);

  /// To be called by a host that was launched through a notification.
  void handleLaunch(const Platform::UserNotification& notification);
  /// Handles the launch for which the center keeps a notification, if there is one. Where the
  /// center cannot be asked now it is asked later, as long as the router lives.
  ///
  ///     router.handlePendingLaunch();  // once the handlers are registered
  void handlePendingLaunch();

  /// Cancels what is scheduled under this identifier, if it has been delivered before and is still
  /// in the delivered list: published behaviour. A notification that was never delivered stays
  /// scheduled. Returns what kept it from being done, or none; then nothing has changed.
  [[nodiscard]] std::optional<Platform::PlatformError> removeScheduledNotifications(
      const std::string& identifier);
  /// Removes delivered notifications with this identifier. Fails as the other does.
  [[nodiscard]] std::optional<Platform::PlatformError> removeDeliveredNotifications(
      const std::string& identifier);

 private:
  class Routes;
  static void takeLaunch(Platform::UserNotificationCenter& center,
                         const std::weak_ptr<Routes>& routes);
  using Failure = std::optional<Platform::PlatformError>;
  using Removal =
      Failure (Platform::UserNotificationCenter::*)(const Platform::UserNotification& notification);
  [[nodiscard]] Failure removeNotifications(const std::string& identifier, Removal removal);

  const Ports ports_;
  const std::shared_ptr<Routes> routes_;  ///< The center's delegate, for the router's life.
};

/// The name under which the interface layer knows the class.
using OVUserNotificationRouter = UserNotificationRouter;

}  // namespace Varnel
