// SPDX-License-Identifier: MIT
#pragma once

#include <filesystem>
#include <memory>
#include <vector>

#include <Varnel/Platform/Api.h>
#include <Varnel/Platform/Ports/NotificationServer.h>
#include <Varnel/Platform/Ports/UserNotificationCenter.h>

namespace Varnel::Platform {

class Calendar;
class Clock;
class MainQueue;
class NotificationStore;
class SystemLog;
class TimeZones;
class UserLocale;
class WallClockTimer;
struct DeliveredNotification;

/// A notification center for systems that can show banners but keep no schedules.
///
/// Schedules and the delivered list live in a store that outlasts the process and that all
/// processes of the product share. Main thread only.
class VARNEL_API ScheduledNotificationCenter final : public UserNotificationCenter {
 public:
  /// All outlive the center. No one else uses the server and the timer.
  struct Ports {
    Clock& clock;
    UserLocale& userLocale;
    TimeZones& timeZones;
    MainQueue& mainQueue;
    SystemLog& systemLog;
    NotificationServer& notificationServer;
    WallClockTimer& timer;
  };

  /// The store's file is made, with its folder, on first use.
  ScheduledNotificationCenter(Ports ports, std::filesystem::path storeFile);
  ~ScheduledNotificationCenter() override;
  ScheduledNotificationCenter(const ScheduledNotificationCenter&) = delete;
  ScheduledNotificationCenter& operator=(const ScheduledNotificationCenter&) = delete;

  void setDelegate(std::weak_ptr<UserNotificationCenterDelegate> delegate) override;
  void scheduleNotification(const UserNotification& notification) override;
  [[nodiscard]] std::vector<UserNotification> scheduledNotifications() override;
  void removeScheduledNotification(const UserNotification& notification) override;
  void deliverNotification(const UserNotification& notification) override;
  [[nodiscard]] std::vector<UserNotification> deliveredNotifications() override;
  void removeDeliveredNotification(const UserNotification& notification) override;
  [[nodiscard]] bool isBusy() const override { return ports_.notificationServer.isBusy(); }

  /// Call this when something outside may have changed what is due: the user's time zone has
  /// changed, or another process has changed the store.
  void recheck();

 private:
  class Banners;

  void deliver(const DeliveredNotification& delivered);
  void awaitNext();
  [[nodiscard]] Calendar calendar() const;

  const Ports ports_;
  const std::unique_ptr<NotificationStore> store_;
  const std::shared_ptr<Banners> banners_;
  std::weak_ptr<UserNotificationCenterDelegate> delegate_;
};

}  // namespace Varnel::Platform
