// SPDX-License-Identifier: MIT
#pragma once

#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include <Varnel/Platform/Api.h>
#include <Varnel/Platform/Values/NotificationSource.h>
#include <Varnel/Platform/Values/Result.h>
#include <Varnel/Platform/Values/UserNotification.h>

namespace Varnel::Platform {

class UserNotificationCenter;

/// The listener of a center, which tells it of events and asks it one question. Called on the main
/// thread, within a call on the center or later. What it takes long to answer is shown meanwhile.
/// It must not throw.
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
///     if (const auto error = center.scheduleNotification(reminder)) tell(*error);
///
/// A call that succeeded is a promise that outlives the process. One that failed has changed
/// nothing; whoever made it may try again (`retryLater`). Only a call in whose last moment somebody
/// takes the center's file away, so that no other can be put there, may have been done all the
/// same. Main thread only.
class VARNEL_API UserNotificationCenter {
 public:
  using Failure = std::optional<PlatformError>;  ///< None when the call was done.
  using Notifications = Result<std::vector<UserNotification>>;

  /// As what a delegate listens.
  enum class Standing {
    application,  ///< The application that the user knows.
    onlooker      ///< Somebody who gives way where the application listens itself.
  };

  virtual ~UserNotificationCenter() = default;
  UserNotificationCenter& operator=(const UserNotificationCenter&) = delete;

  /// The only listener of this process from now on; held weakly. Notifications that came due
  /// earlier are delivered now at the latest: where nobody but the application delivers, they wait
  /// for a delegate. One that was delivered without a listener is not told of again.
  virtual void setDelegate(std::weak_ptr<UserNotificationCenterDelegate> delegate,
                           Standing standing = Standing::application) = 0;

  /// The notification for which the application was started, because the user clicked it while it
  /// did not run: once, and no later than five minutes after the click. None otherwise.
  ///
  ///     const auto launch = center.takeLaunchNotification();
  ///     if (launch && *launch) show(**launch);
  [[nodiscard]] virtual Result<std::optional<UserNotification>> takeLaunchNotification() = 0;

  /// Makes several calls on this center together: all are done or, where one fails or `calls`
  /// answers a failure, none. Nothing is delivered, shown or taken away before that is decided.
  /// `calls` may be run more than once, each time from the same start; it makes no calls but those
  /// on this center's two lists. What it throws comes out of this, and none is done.
  ///
  ///     center.change([&]() -> UserNotificationCenter::Failure {
  ///       if (auto error = center.removeScheduledNotification(old)) return error;
  ///       return center.scheduleNotification(reminder);
  ///     });
  [[nodiscard]] virtual Failure change(const std::function<Failure()>& calls) = 0;

  /// Keeps the notification until its delivery date, in the place of one with its identifier. It is
  /// due at once where the date is past or absent, which stands for now.
  [[nodiscard]] virtual Failure scheduleNotification(const UserNotification& notification) = 0;

  /// The notifications that have a delivery ahead, the next one first.
  [[nodiscard]] virtual Notifications scheduledNotifications() = 0;

  /// Cancels all deliveries to come of what is the same (`isSameNotification`, with the next date).
  /// The notification stays in the delivered list if it is there.
  [[nodiscard]] virtual Failure removeScheduledNotification(
      const UserNotification& notification) = 0;

  /// Delivers now, whatever the dates of the notification say, also where there is no delegate. It
  /// is in the delivered list when this returns, in the place of one with its identifier, whose
  /// banner it replaces.
  [[nodiscard]] virtual Failure deliverNotification(const UserNotification& notification) = 0;

  /// The delivered notifications that were neither removed nor dismissed by the user, the latest
  /// first: also those whose banner was not wanted, has yet to come or has gone.
  [[nodiscard]] virtual Notifications deliveredNotifications() = 0;

  /// Forgets a delivered notification and takes its banner away; deliveries to come stay.
  [[nodiscard]] virtual Failure removeDeliveredNotification(
      const UserNotification& notification) = 0;

  /// Calls `retry` once, on the main thread, when a call that failed may succeed. The pauses grow
  /// while calls go on failing.
  virtual void retryLater(std::function<void()> retry) = 0;

  /// Tells, later and on the main thread, what keeps banners from being shown at present, or none.
  virtual void checkBanners(std::function<void(const Failure& obstacle)> answer) = 0;

  /// Whether banners are still to be shown or taken away. A program that is about to end lets the
  /// main queue run meanwhile, not for long: what shows the banners may hang.
  ///
  ///     mainQueue.runWhile([&] { return center.isBusy(); }, std::chrono::seconds(3));
  [[nodiscard]] virtual bool isBusy() const = 0;
};

/// Hands out the notification centers of products. Main thread only.
class VARNEL_API UserNotificationCenters {
 public:
  virtual ~UserNotificationCenters() = default;
  UserNotificationCenters& operator=(const UserNotificationCenters&) = delete;

  /// The center of the product with the source's identifier, always the same one; it lives as long
  /// as this object, and shows the source that it was first asked for with. A system that gives
  /// each application one center answers with that.
  [[nodiscard]] virtual UserNotificationCenter& center(const NotificationSource& source) = 0;
};

}  // namespace Varnel::Platform
