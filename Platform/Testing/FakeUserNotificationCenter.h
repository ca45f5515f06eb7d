// SPDX-License-Identifier: MIT
#pragma once

#include <algorithm>
#include <chrono>
#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <system_error>
#include <utility>
#include <vector>

#include <Varnel/Platform/Ports/UserNotificationCenter.h>
#include <Varnel/Platform/Testing/FaultPlan.h>

namespace Varnel::Platform::Testing {

/// A center without a clock: notifications come due, and are clicked, when the test says so. What
/// repeats waits for ever, because its dates need a calendar.
///
///     FakeUserNotificationCenter center;
///     UserNotificationRouter router({center, application, mainQueue});
///     EXPECT_FALSE(center.deliverNotification(reminder));
///     center.activate(reminder);
///
/// One thread.
class FakeUserNotificationCenter final : public UserNotificationCenter {
 public:
  /// Moved by the test alone.
  Date now;
  /// The notifications that were shown, because the delegate wanted it or there was none, oldest
  /// first.
  std::vector<UserNotification> presented;
  /// The calls on its two lists count, each for itself. One that goes wrong fails, and with it all
  /// that it is made together with.
  std::shared_ptr<FaultPlan> faults = std::make_shared<FaultPlan>();
  /// What `checkBanners` answers.
  Failure obstacle;

  void setDelegate(std::weak_ptr<UserNotificationCenterDelegate> delegate,
                   Standing = Standing::application) override {
    delegate_ = std::move(delegate);
  }
  [[nodiscard]] Result<std::optional<UserNotification>> takeLaunchNotification() override {
    if (auto error = fail()) return *error;
    const auto clicked = std::exchange(launch_, std::nullopt);
    if (!clicked || now >= launchDate_ + std::chrono::minutes(5))
      return std::optional<UserNotification>();
    return clicked;
  }
  [[nodiscard]] std::shared_ptr<UserNotificationCenterDelegate> delegate() const {
    return delegate_.lock();
  }

  [[nodiscard]] Failure change(const std::function<Failure()>& calls) override {
    if (isChanging_) return calls();
    const State start = state_;
    Failure error;
    isChanging_ = true;
    try {
      error = calls();
    } catch (...) {
      isChanging_ = false;
      state_ = start;
      throw;
    }
    isChanging_ = false;
    if (error) state_ = start;
    for (const auto& notification : std::exchange(state_.due, {})) show(notification);
    return error;
  }

  [[nodiscard]] Failure scheduleNotification(const UserNotification& notification) override {
    return call([&] {
      replace(state_.scheduled, notification);
      state_.scheduled.push_back(notification);
      state_.scheduled.back().deliveryDate = notification.deliveryDate.value_or(now);
      std::stable_sort(state_.scheduled.begin(), state_.scheduled.end(),
                       [](const auto& left, const auto& right) {
                         return left.deliveryDate < right.deliveryDate;
                       });
    });
  }
  [[nodiscard]] Notifications scheduledNotifications() override {
    if (auto error = fail()) return *error;
    return state_.scheduled;
  }
  [[nodiscard]] Failure removeScheduledNotification(const UserNotification& notification) override {
    return call([&] { remove(state_.scheduled, notification); });
  }

  [[nodiscard]] Failure deliverNotification(const UserNotification& notification) override {
    return call([&] {
      UserNotification delivered = notification;
      delivered.actualDeliveryDate = now;
      replace(state_.delivered, notification);
      state_.delivered.insert(state_.delivered.begin(), delivered);
      state_.due.push_back(std::move(delivered));
    });
  }
  [[nodiscard]] Notifications deliveredNotifications() override {
    if (auto error = fail()) return *error;
    return state_.delivered;
  }
  [[nodiscard]] Failure removeDeliveredNotification(const UserNotification& notification) override {
    return call([&] {
      remove(state_.delivered, notification);
      remove(state_.due, notification);
    });
  }

  void retryLater(std::function<void()> retry) override { retries_.push_back(std::move(retry)); }
  void checkBanners(std::function<void(const Failure&)> answer) override { answer(obstacle); }
  [[nodiscard]] bool isBusy() const override { return false; }

  /// How many wait for `retry`.
  [[nodiscard]] std::size_t retryCount() const { return retries_.size(); }
  /// Acts as the end of a pause.
  void retry() {
    for (const auto& each : std::exchange(retries_, {})) each();
  }

  /// Lets time pass: what comes due meanwhile is delivered now.
  void advanceTo(Date date) {
    now = date;
    for (const UserNotification& each : std::vector(state_.scheduled)) {
      if (each.deliveryRepeatInterval || each.deliveryDate > now) continue;
      remove(state_.scheduled, each);
      static_cast<void>(deliverNotification(each));
    }
  }

  /// Acts as a click of the user while the application does not run, which is started then.
  void startBy(const UserNotification& notification) {
    launch_ = notification;
    launchDate_ = now;
  }
  /// Acts as a click of the user.
  void activate(const UserNotification& notification) {
    if (const auto listener = delegate_.lock()) listener->didActivate(*this, notification);
  }

 private:
  struct State {
    std::vector<UserNotification> scheduled;
    std::vector<UserNotification> delivered;
    std::vector<UserNotification> due;  ///< The delegate has not heard of them.
  };

  static void replace(std::vector<UserNotification>& list, const UserNotification& notification) {
    if (notification.identifier) remove(list, notification);
  }
  static void remove(std::vector<UserNotification>& list, const UserNotification& notification) {
    const UserNotification copy = notification;  // It may be an element of the list.
    std::erase_if(list, [&](const auto& each) { return isSameNotification(each, copy); });
  }

  Failure fail() {
    if (faults->next() == Fault::none) return std::nullopt;
    return PlatformError(std::make_error_code(std::errc::no_space_on_device));
  }

  template <typename Call>
  Failure call(Call made) {
    return change([&]() -> Failure {
      if (auto error = fail()) return error;
      made();
      return std::nullopt;
    });
  }

  void show(const UserNotification& notification) {
    const auto listener = delegate_.lock();
    if (!listener || listener->shouldPresent(*this, notification))
      presented.push_back(notification);
    if (listener) listener->didDeliver(*this, notification);
  }

  std::weak_ptr<UserNotificationCenterDelegate> delegate_;
  State state_;
  bool isChanging_ = false;
  std::optional<UserNotification> launch_;
  Date launchDate_;
  std::vector<std::function<void()>> retries_;
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
