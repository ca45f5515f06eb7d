// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Generic/ScheduledNotificationCenter.h>

#include <algorithm>
#include <utility>

#include <Varnel/Platform/Generic/NotificationStore.h>
#include <Varnel/Platform/Ports/Clock.h>
#include <Varnel/Platform/Ports/TimeZones.h>
#include <Varnel/Platform/Ports/UserLocale.h>
#include <Varnel/Platform/Ports/WallClockTimer.h>
#include <Varnel/Platform/Text/Calendar.h>
#include <Varnel/Platform/Values/Restorer.h>

namespace Varnel::Platform {
namespace {

using enum DeliveryState;

const std::vector<DeliveryState>& deliveredStates() {
  static const std::vector states{due, hidden, toShow, shown, expired};
  return states;
}

}  // namespace

// The delegate, as the connection knows it.
class ScheduledNotificationCenter::Host final : public NotificationHost {
 public:
  explicit Host(ScheduledNotificationCenter& center) : center_(center) {}

  std::weak_ptr<UserNotificationCenterDelegate> delegate;

  bool shouldPresent(const UserNotification& notification) override {
    const auto asked = delegate.lock();
    return !asked || asked->shouldPresent(center_, notification);
  }
  void didDeliver(const UserNotification& notification) override {
    if (const auto told = delegate.lock()) told->didDeliver(center_, notification);
  }
  void didActivate(const NotificationActivation& activation) override {
    if (const auto told = delegate.lock()) told->didActivate(center_, activation.notification);
  }

 private:
  ScheduledNotificationCenter& center_;
};

ScheduledNotificationCenter::ScheduledNotificationCenter(const Ports& ports,
                                                         const std::string& storeFile,
                                                         NotificationSource source,
                                                         DelivererConnection& connection)
    : ports_(ports),
      source_(std::move(source)),
      connection_(connection),
      store_(std::make_unique<NotificationStore>(
          DurableFile::Ports{ports.privateFiles, ports.systemLog}, storeFile, Migrating::allowed)),
      host_(std::make_unique<Host>(*this)) {
  ports_.timer.setHandler([this] { tick(); });
}

ScheduledNotificationCenter::~ScheduledNotificationCenter() {
  connection_.setHost({}, Standing::application);
  ports_.timer.disarm();
  ports_.timer.setHandler(nullptr);
}

void ScheduledNotificationCenter::setDelegate(
    std::weak_ptr<UserNotificationCenterDelegate> delegate, Standing standing) {
  host_->delegate = std::move(delegate);
  // There is a host as long as the delegate lives.
  const auto present = host_->delegate.lock();
  const auto host = present ? std::shared_ptr<NotificationHost>(present, host_.get()) : nullptr;
  connection_.setHost(host, standing);
}

Result<std::optional<UserNotification>> ScheduledNotificationCenter::takeLaunchNotification() {
  return store_->takeLaunch(ports_.clock.now());
}

UserNotificationCenter::Failure ScheduledNotificationCenter::change(
    const std::function<Failure()>& calls) {
  if (isChanging_) return calls();
  Failure error;
  {
    const Restorer changing(isChanging_);
    isChanging_ = true;
    error = store_->change([&] {
      isUrgent_ = false;
      return calls();
    });
  }
  // Also after a failure, because a store that is taken away may have kept the change.
  std::exchange(isUrgent_, false) && !error ? connection_.changedAtOnce() : connection_.changed();
  return error;
}

UserNotificationCenter::Failure ScheduledNotificationCenter::scheduleNotification(
    const UserNotification& notification) {
  return change([&] {
    auto error = store_->keepSource(source_);
    return error ? error : store_->plan(notification, ports_.clock.now(), calendar());
  });
}

UserNotificationCenter::Notifications ScheduledNotificationCenter::scheduledNotifications() {
  auto scheduled = store_->deliveries({planned});
  if (!scheduled) return scheduled.error();
  const Calendar present = calendar();
  std::vector<UserNotification> notifications;
  for (Delivery& delivery : *scheduled) {
    delivery.schedule.notification.deliveryDate = nextDate(delivery.schedule, present);
    notifications.push_back(std::move(delivery.schedule.notification));
  }
  std::stable_sort(notifications.begin(), notifications.end(),
                   [](const UserNotification& left, const UserNotification& right) {
                     return left.deliveryDate.value_or(Date::max()) <
                            right.deliveryDate.value_or(Date::max());
                   });
  return notifications;
}

UserNotificationCenter::Failure ScheduledNotificationCenter::removeScheduledNotification(
    const UserNotification& notification) {
  const Calendar present = calendar();
  return change([&]() -> Failure {
    const auto candidates = store_->deliveries({planned});
    if (!candidates) return candidates.error();
    for (const Delivery& each : *candidates) {
      UserNotification candidate = each.schedule.notification;
      candidate.deliveryDate = nextDate(each.schedule, present);
      if (isSameNotification(candidate, notification))
        if (auto error = store_->remove(each.number)) return error;
    }
    return std::nullopt;
  });
}

UserNotificationCenter::Failure ScheduledNotificationCenter::deliverNotification(
    const UserNotification& notification) {
  return change([&] {
    auto error = store_->keepSource(source_);
    if (!error) error = store_->makeDue(notification, ports_.clock.now());
    if (!error) isUrgent_ = true;
    return error;
  });
}

UserNotificationCenter::Notifications ScheduledNotificationCenter::deliveredNotifications() {
  auto delivered = store_->deliveries(deliveredStates());
  if (!delivered) return delivered.error();
  std::vector<UserNotification> notifications;
  for (Delivery& delivery : *delivered)
    notifications.push_back(std::move(delivery.schedule.notification));
  return notifications;
}

UserNotificationCenter::Failure ScheduledNotificationCenter::removeDeliveredNotification(
    const UserNotification& notification) {
  return change([&]() -> Failure {
    const auto candidates = store_->deliveries(deliveredStates());
    if (!candidates) return candidates.error();
    for (const Delivery& each : *candidates)
      if (isSameNotification(each.schedule.notification, notification))
        if (auto error = store_->remove(each.number)) return error;
    return std::nullopt;
  });
}

void ScheduledNotificationCenter::retryLater(std::function<void()> retry) {
  retries_.push_back(std::move(retry));
  awaitRetry();
}

void ScheduledNotificationCenter::awaitRetry() {
  if (!std::exchange(isWaiting_, true)) pause_.failed(ports_.clock.now());
  ports_.timer.arm(pause_.end());
}

void ScheduledNotificationCenter::tick() {
  if (!pause_.isOver(ports_.clock.now())) return awaitRetry();
  isWaiting_ = false;
  for (const auto& retry : std::exchange(retries_, {})) retry();
  if (retries_.empty()) pause_.succeeded();
}

void ScheduledNotificationCenter::checkBanners(
    std::function<void(const Failure& obstacle)> answer) {
  connection_.checkBanners(std::move(answer));
}

// The user's present time zone.
Calendar ScheduledNotificationCenter::calendar() const {
  return {ports_.userLocale, ports_.timeZones};
}

}  // namespace Varnel::Platform
