// SPDX-License-Identifier: MIT
#pragma once

#include <chrono>
#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include <Varnel/Platform/Api.h>
#include <Varnel/Platform/Ports/NotificationServer.h>
#include <Varnel/Platform/Ports/UserNotificationCenter.h>
#include <Varnel/Platform/Values/GrowingPause.h>

namespace Varnel::Platform {

class Calendar;
class Clock;
class FileLock;
class MainQueue;
class NotificationStore;
class PrivateFiles;
class SystemLog;
class TimeZones;
class UserLocale;
class WallClockTimer;

/// A notification center for systems that can show banners but keep no schedules.
///
/// Schedules and the delivered list live in a store that outlasts the process and that all
/// processes of the product share. One of them delivers: the first with a delegate that finds
/// something due, until it ends; it holds a lock on a file beside the store. What cannot be done,
/// because of the store or of the server, is tried again, after pauses that grow from `minPause` to
/// `maxPause`, and at once when a server appears. Main thread only.
class VARNEL_API ScheduledNotificationCenter final : public UserNotificationCenter {
 public:
  static constexpr std::chrono::seconds minPause{1};
  static constexpr std::chrono::minutes maxPause{5};

  /// All outlive the center. No one else uses the server and the timer.
  struct Ports {
    Clock& clock;
    UserLocale& userLocale;
    TimeZones& timeZones;
    MainQueue& mainQueue;
    PrivateFiles& privateFiles;
    SystemLog& systemLog;
    NotificationServer& notificationServer;
    WallClockTimer& timer;
  };

  /// The store's folder is made now, its file on first use.
  ScheduledNotificationCenter(Ports ports, const std::string& storeFile);
  ~ScheduledNotificationCenter() override;
  ScheduledNotificationCenter(const ScheduledNotificationCenter&) = delete;
  ScheduledNotificationCenter& operator=(const ScheduledNotificationCenter&) = delete;

  void setDelegate(std::weak_ptr<UserNotificationCenterDelegate> delegate,
                   Standing standing = Standing::application) override;
  [[nodiscard]] Result<std::optional<UserNotification>> takeLaunchNotification() override {
    return std::optional<UserNotification>();
  }
  [[nodiscard]] Failure change(const std::function<Failure()>& calls) override;
  [[nodiscard]] Failure scheduleNotification(const UserNotification& notification) override;
  [[nodiscard]] Notifications scheduledNotifications() override;
  [[nodiscard]] Failure removeScheduledNotification(const UserNotification& notification) override;
  [[nodiscard]] Failure deliverNotification(const UserNotification& notification) override;
  [[nodiscard]] Notifications deliveredNotifications() override;
  [[nodiscard]] Failure removeDeliveredNotification(const UserNotification& notification) override;
  void retryLater(std::function<void()> retry) override;
  void checkBanners(std::function<void(const Failure& obstacle)> answer) override;
  [[nodiscard]] bool isBusy() const override { return ports_.notificationServer.isBusy(); }

  /// Call this when something outside may have changed what is due: the user's time zone has
  /// changed, or another process has changed the store.
  void recheck();

 private:
  class Banners;

  [[nodiscard]] Failure removeThose(const UserNotification& notification, bool isDelivered);
  [[nodiscard]] Failure deliverDue();
  [[nodiscard]] Failure decideDue();
  void tellDelivered(const UserNotification& notification);
  [[nodiscard]] bool mayDeliver() const { return isAskedToDeliver_ || !delegate_.expired(); }
  [[nodiscard]] Failure becomeDeliverer();
  void report(const Failure& failure);
  void tick();
  void awaitNext();
  [[nodiscard]] Calendar calendar() const;

  const Ports ports_;
  const std::string lockFile_;
  const std::unique_ptr<NotificationStore> store_;
  const std::shared_ptr<Banners> banners_;
  std::weak_ptr<UserNotificationCenterDelegate> delegate_;
  bool isAskedToDeliver_ = false;
  std::unique_ptr<FileLock> delivererLock_;

  bool isOccupied_ = false;  ///< Calls are being made together, or a recheck is under way.
  bool isBehind_ = false;    ///< Something is left that the last recheck should have done.
  std::string lastReport_;
  std::vector<std::function<void()>> retries_;
  bool isToRetry_ = false;  ///< When the pause is over.
  GrowingPause pause_{minPause, maxPause};
};

}  // namespace Varnel::Platform
