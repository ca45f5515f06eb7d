// SPDX-License-Identifier: MIT
#include <Varnel/Reminders/UserNotificationRouter.h>

#include <map>
#include <mutex>
#include <utility>

#include <Varnel/Basalt/MainQueueExecutor.h>
#include <Varnel/Context/BuildSwitches.h>
#include <Varnel/Context/Globals.h>
#include <Varnel/Platform/Ports/Application.h>
#include <Varnel/Platform/Ports/MainQueue.h>
#include <Varnel/Platform/Ports/Ports.h>
#include <Varnel/Platform/Ports/UserNotificationCenter.h>

namespace Varnel {

using Platform::UserNotification;
using Platform::UserNotificationCenter;

class UserNotificationRouter::Routes final : public Platform::UserNotificationCenterDelegate {
 public:
  explicit Routes(const Platform::Application& application) : application_(application) {}

  Basalt::Producer<Event> producer(const std::string& identifier) {
    const std::lock_guard lock(mutex_);
    return producers_[identifier];
  }

  void route(const UserNotification& notification, EventKind kind) const {
    if (!notification.identifier) return;
    if (const auto producer = existingProducer(*notification.identifier))
      producer->update({notification, kind});
  }

  void didDeliver(UserNotificationCenter&, const UserNotification& notification) override {
    route(notification, EventKind::didDeliver);
  }
  void didActivate(UserNotificationCenter&, const UserNotification& notification) override {
    route(notification, EventKind::didActivate);
  }
  bool shouldPresent(UserNotificationCenter&, const UserNotification&) override {
    return !application_.isActive();
  }

 private:
  std::optional<Basalt::Producer<Event>> existingProducer(const std::string& identifier) const {
    const std::lock_guard lock(mutex_);
    const auto found = producers_.find(identifier);
    if (found == producers_.end()) return std::nullopt;
    return found->second;
  }

  const Platform::Application& application_;
  mutable std::mutex mutex_;  ///< Owns `producers_`.
  std::map<std::string, Basalt::Producer<Event>> producers_;
};

namespace {

UserNotificationCenter& centerOfProduct(const Platform::Ports& ports) {
  const BuildSwitches& product = BuildSwitches::ofThisProduct();
  return ports.userNotificationCenters.get().center({.identifier = Globals::baseIdentifier(),
                                                     .name = Globals::applicationName(),
                                                     .desktopEntry = product.desktopEntry,
                                                     .icon = product.icon});
}

}  // namespace

std::optional<UserNotificationRouter::EventKind> UserNotificationRouter::eventKindWithRawValue(
    std::int64_t rawValue) {
  for (const auto kind : {EventKind::didLaunchWith, EventKind::didDeliver, EventKind::didActivate})
    if (static_cast<std::int64_t>(kind) == rawValue) return kind;
  return std::nullopt;
}

UserNotificationRouter::UserNotificationRouter(Ports ports, Standing standing)
    : ports_(ports), routes_(std::make_shared<Routes>(ports.application)) {
  ports_.userNotificationCenter.setDelegate(routes_, standing);
}

UserNotificationRouter::UserNotificationRouter(const Platform::Ports& ports)
    : UserNotificationRouter(Ports{centerOfProduct(ports), ports.application, ports.mainQueue}) {}

UserNotificationRouter::UserNotificationRouter()
    : UserNotificationRouter(Platform::processPorts()) {}

UserNotificationRouter::~UserNotificationRouter() = default;

UserNotificationCenter& UserNotificationRouter::defaultUserNotificationCenter() {
  return centerOfProduct(Platform::processPorts());
}

UserNotificationCenter& UserNotificationRouter::userNotificationCenter() const {
  return ports_.userNotificationCenter;
}

void UserNotificationRouter::register_(const std::string& identifier, Handler handler) {
  channel(identifier)
      .onUpdate(std::make_shared<Basalt::MainQueueExecutor>(ports_.mainQueue),
                [handler = std::move(handler)](const Event& event) {
                  handler(event.notification, event.kind);
                });
}

Basalt::Channel<UserNotificationRouter::Event> UserNotificationRouter::channel(
    const std::string& identifier) {
  return routes_->producer(identifier).channel();
}

void UserNotificationRouter::handleLaunch(const UserNotification& notification) {
  routes_->route(notification, EventKind::didLaunchWith);
}

void UserNotificationRouter::handlePendingLaunch() {
  takeLaunch(ports_.userNotificationCenter, routes_);
}

void UserNotificationRouter::takeLaunch(UserNotificationCenter& center,
                                        const std::weak_ptr<Routes>& routes) {
  const auto alive = routes.lock();
  if (!alive) return;
  const auto launch = center.takeLaunchNotification();
  if (!launch) return center.retryLater([&center, routes] { takeLaunch(center, routes); });
  if (*launch) alive->route(**launch, EventKind::didLaunchWith);
}

std::optional<Platform::PlatformError> UserNotificationRouter::removeScheduledNotifications(
    const std::string& identifier) {
  return removeNotifications(identifier, &UserNotificationCenter::removeScheduledNotification);
}

std::optional<Platform::PlatformError> UserNotificationRouter::removeDeliveredNotifications(
    const std::string& identifier) {
  return removeNotifications(identifier, &UserNotificationCenter::removeDeliveredNotification);
}

UserNotificationRouter::Failure UserNotificationRouter::removeNotifications(
    const std::string& identifier, Removal removal) {
  UserNotificationCenter& center = ports_.userNotificationCenter;
  return center.change([&]() -> Failure {
    // Both removals look for their candidates here: part of the published behaviour.
    const auto delivered = center.deliveredNotifications();
    if (!delivered) return delivered.error();
    for (const UserNotification& notification : *delivered)
      if (notification.identifier == identifier)
        if (auto error = (center.*removal)(notification)) return error;
    return std::nullopt;
  });
}

}  // namespace Varnel
