// SPDX-License-Identifier: MIT
#pragma once

#include <memory>
#include <string>
#include <vector>

#include <Varnel/Platform/Api.h>
#include <Varnel/Platform/Values/NotificationSource.h>
#include <Varnel/Platform/Values/UserNotification.h>

namespace Varnel::Platform {

class UserNotificationCenter;

/// The listener of a center, which tells it of events and asks it one question. Called on the main
/// thread.
class VARNEL_API UserNotificationCenterDelegate {
 public:
  virtual ~UserNotificationCenterDelegate() = default;

  /// The notification has been delivered, whether or not it was shown.
  virtual void didDeliver(UserNotificationCenter& center, const UserNotification& notification) = 0;

  /// The user clicked the notification or its action button.
  virtual void didActivate(UserNotificationCenter& center,
                           const UserNotification& notification) = 0;

  /// Whether to show a notification that is being delivered.
  [[nodiscard]] virtual bool shouldPresent(UserNotificationCenter& center,
                                           const UserNotification& notification) = 0;
};

/// Delivers notifications to the user, also those that were scheduled by an earlier run.
///
///     center.setDelegate(router);
///     center.scheduleNotification(reminder);
///
/// Main thread only. No operation fails visibly: a notification that cannot be kept or shown is
/// reported to the system's log.
class VARNEL_API UserNotificationCenter {
 public:
  virtual ~UserNotificationCenter() = default;

  /// The only listener from now on; held weakly. Notifications that came due earlier are delivered
  /// now. Without a delegate nothing is delivered, and due notifications wait.
  virtual void setDelegate(std::weak_ptr<UserNotificationCenterDelegate> delegate) = 0;

  /// Keeps the notification until its delivery date, in the place of one with its identifier.
  virtual void scheduleNotification(const UserNotification& notification) = 0;

  /// The notifications that have a delivery ahead, the next one first.
  [[nodiscard]] virtual std::vector<UserNotification> scheduledNotifications() = 0;

  /// Cancels all deliveries to come. The notification stays in the delivered list if it is there.
  virtual void removeScheduledNotification(const UserNotification& notification) = 0;

  /// Delivers now, whatever the dates of the notification say, and replaces its banner.
  virtual void deliverNotification(const UserNotification& notification) = 0;

  /// The delivered notifications that were neither removed nor dismissed by the user, the latest
  /// first.
  [[nodiscard]] virtual std::vector<UserNotification> deliveredNotifications() = 0;

  /// Forgets a delivered notification and takes its banner away; deliveries to come stay.
  virtual void removeDeliveredNotification(const UserNotification& notification) = 0;

  /// Whether banners are still to be shown or taken away. A program that is about to end lets the
  /// main queue run meanwhile:
  ///
  ///     mainQueue.runWhile([&] { return center.isBusy(); }, std::chrono::seconds(3));
  [[nodiscard]] virtual bool isBusy() const = 0;
};

/// Hands out the notification centers of products. Main thread only.
class VARNEL_API UserNotificationCenters {
 public:
  virtual ~UserNotificationCenters() = default;

  /// The center of the product with the source's identifier, always the same one; it lives as long
  /// as this object, and shows the source that it was first asked for with. A system that gives
  /// each application one center answers with that.
  [[nodiscard]] virtual UserNotificationCenter& center(const NotificationSource& source) = 0;
};

}  // namespace Varnel::Platform
