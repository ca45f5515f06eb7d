// SPDX-License-Identifier: MIT
#pragma once

#include <algorithm>
#include <memory>
#include <string>
#include <utility>
#include <vector>

#include <Varnel/Platform/Ports/UserNotificationCenter.h>

namespace Varnel::Platform::Testing {

/// A center without a clock: notifications come due, and are clicked, when the test says so.
///
///     FakeUserNotificationCenter center;
///     UserNotificationRouter router({center, application, mainQueue});
///     center.deliverNotification(center.scheduledNotifications().front());
///     center.activate(center.deliveredNotifications().front());
///
/// One thread.
class FakeUserNotificationCenter final : public UserNotificationCenter {
 public:
  /// The notifications that the delegate wanted to be shown, oldest first.
  std::vector<UserNotification> presented;

  void setDelegate(std::weak_ptr<UserNotificationCenterDelegate> delegate) override {
    delegate_ = std::move(delegate);
  }
  [[nodiscard]] std::shared_ptr<UserNotificationCenterDelegate> delegate() const {
    return delegate_.lock();
  }

  void scheduleNotification(const UserNotification& notification) override {
    remove(scheduled_, notification);
    scheduled_.push_back(notification);
    std::stable_sort(scheduled_.begin(), scheduled_.end(), [](const auto& left, const auto& right) {
      return left.deliveryDate < right.deliveryDate;
    });
  }
  [[nodiscard]] std::vector<UserNotification> scheduledNotifications() override {
    return scheduled_;
  }
  void removeScheduledNotification(const UserNotification& notification) override {
    remove(scheduled_, notification);
  }

  void deliverNotification(const UserNotification& notification) override {
    remove(delivered_, notification);
    delivered_.insert(delivered_.begin(), notification);
    const auto listener = delegate_.lock();
    if (!listener) return;
    if (listener->shouldPresent(*this, notification)) presented.push_back(notification);
    listener->didDeliver(*this, notification);
  }
  [[nodiscard]] std::vector<UserNotification> deliveredNotifications() override {
    return delivered_;
  }
  void removeDeliveredNotification(const UserNotification& notification) override {
    remove(delivered_, notification);
  }
  [[nodiscard]] bool isBusy() const override { return false; }

  /// Acts as a click of the user.
  void activate(const UserNotification& notification) {
    if (const auto listener = delegate_.lock()) listener->didActivate(*this, notification);
  }

 private:
  static void remove(std::vector<UserNotification>& list, const UserNotification& notification) {
    const UserNotification copy = notification;  // It may be an element of the list.
    std::erase_if(list, [&](const auto& each) { return isSameNotification(each, copy); });
  }

  std::weak_ptr<UserNotificationCenterDelegate> delegate_;
  std::vector<UserNotification> scheduled_;
  std::vector<UserNotification> delivered_;
};

/// Gives every product the same fake center.
class FakeUserNotificationCenters final : public UserNotificationCenters {
 public:
  FakeUserNotificationCenter theCenter;

  [[nodiscard]] UserNotificationCenter& center(const NotificationSource&) override {
    return theCenter;
  }
};

}  // namespace Varnel::Platform::Testing
