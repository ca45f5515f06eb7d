// SPDX-License-Identifier: MIT
#pragma once

#include <chrono>
#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include <Varnel/Platform/Api.h>
#include <Varnel/Platform/Generic/DelivererConnection.h>
#include <Varnel/Platform/Ports/UserNotificationCenter.h>
#include <Varnel/Platform/Values/GrowingPause.h>

namespace Varnel::Platform {

class Calendar;
class Clock;
class NotificationStore;
class PrivateFiles;
class SystemLog;
class TimeZones;
class UserLocale;
class WallClockTimer;

/// A notification center for systems that can show banners but keep no schedules.
///
/// Schedules and the delivered list live in a store that outlasts the process and that all
/// processes of the product share. Who delivers what the store holds is told of every change: see
/// `DelivererConnection`. Main thread only.
class VARNEL_API ScheduledNotificationCenter final : public UserNotificationCenter {
 public:
  /// Pauses grow from the one to the other.
  static constexpr std::chrono::seconds minPause{1};
  static constexpr std::chrono::minutes maxPause{5};

  /// All outlive the center. No one else uses the timer.
  struct Ports {
    Clock& clock;
    UserLocale& userLocale;
    TimeZones& timeZones;
    PrivateFiles& privateFiles;
    SystemLog& systemLog;
    WallClockTimer& timer;
  };

  /// The connection outlives the center and leads to who delivers from the same store, whose file
  /// is made on first use.
  ScheduledNotificationCenter(const Ports& ports, const std::string& storeFile,
                              NotificationSource source, DelivererConnection& connection);
  ~ScheduledNotificationCenter() override;
  ScheduledNotificationCenter(const ScheduledNotificationCenter&) = delete;
  ScheduledNotificationCenter& operator=(const ScheduledNotificationCenter&) = delete;

  void setDelegate(std::weak_ptr<UserNotificationCenterDelegate> delegate,
                   Standing standing = Standing::application) override;
  [[nodiscard]] Result<std::optional<UserNotification>> takeLaunchNotification() override;
  [[nodiscard]] Failure change(const std::function<Failure()>& calls) override;
  [[nodiscard]] Failure scheduleNotification(const UserNotification& notification) override;
  [[nodiscard]] Notifications scheduledNotifications() override;
  [[nodiscard]] Failure removeScheduledNotification(const UserNotification& notification) override;
  [[nodiscard]] Failure deliverNotification(const UserNotification& notification) override;
  [[nodiscard]] Notifications deliveredNotifications() override;
  [[nodiscard]] Failure removeDeliveredNotification(const UserNotification& notification) override;
  void retryLater(std::function<void()> retry) override;
  void checkBanners(std::function<void(const Failure& obstacle)> answer) override;
  [[nodiscard]] bool isBusy() const override { return connection_.isBusy(); }

 private:
  class Host;

  void tick();
  void awaitRetry();
  [[nodiscard]] Calendar calendar() const;

  const Ports ports_;
  const NotificationSource source_;
  DelivererConnection& connection_;
  const std::unique_ptr<NotificationStore> store_;
  const std::unique_ptr<Host> host_;

  bool isChanging_ = false;  ///< Calls are being made together.
  bool isUrgent_ = false;    ///< They have delivered something.
  std::vector<std::function<void()>> retries_;
  bool isWaiting_ = false;  ///< For the pause before them.
  GrowingPause pause_{minPause, maxPause};
};

}  // namespace Varnel::Platform
