// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Generic/ScheduledNotificationCenter.h>

#include <algorithm>
#include <map>
#include <string>
#include <utility>

#include <Varnel/Platform/Generic/NotificationStore.h>
#include <Varnel/Platform/Ports/Clock.h>
#include <Varnel/Platform/Ports/MainQueue.h>
#include <Varnel/Platform/Ports/NotificationServer.h>
#include <Varnel/Platform/Ports/TimeZones.h>
#include <Varnel/Platform/Ports/UserLocale.h>
#include <Varnel/Platform/Ports/WallClockTimer.h>
#include <Varnel/Platform/Text/Calendar.h>

namespace Varnel::Platform {
namespace {

constexpr std::chrono::minutes retryDelay(1);

Banner bannerOf(const UserNotification& notification) {
  return {.title = notification.title.value_or(""),
          .text = notification.informativeText.value_or(""),
          .actionTitle = notification.actionButtonTitle.value_or(""),
          .dismissTitle = notification.otherButtonTitle.value_or("")};
}

}  // namespace

// Hears of the banners that this process has shown, by the keys of their notifications. It ends
// with its center; weak references to it then find it gone.
class ScheduledNotificationCenter::Banners final : public NotificationServer::Observer {
 public:
  explicit Banners(ScheduledNotificationCenter& center) : center_(center) {}

  void bannerShown(const std::string& key, const std::string& reference) override {
    center_.store_->setBannerReference(key, reference);
  }
  void bannerActivated(const std::string& key) override {
    const auto shown = shown_.extract(key);
    const auto delegate = center_.delegate_.lock();
    if (shown && delegate) delegate->didActivate(center_, shown.mapped());
  }
  void bannerDismissed(const std::string& key) override {
    shown_.erase(key);
    center_.store_->removeDelivered(key);
  }

  void show(const DeliveredNotification& delivered) {
    shown_.insert_or_assign(delivered.key, delivered.notification);
    center_.ports_.notificationServer.show(delivered.key, bannerOf(delivered.notification),
                                           delivered.bannerReference);
  }
  void close(const DeliveredNotification& delivered) {
    shown_.erase(delivered.key);
    center_.ports_.notificationServer.close(delivered.key, delivered.bannerReference);
  }

  ScheduledNotificationCenter& center() const { return center_; }

 private:
  ScheduledNotificationCenter& center_;
  std::map<std::string, UserNotification> shown_;
};

ScheduledNotificationCenter::ScheduledNotificationCenter(Ports ports,
                                                         std::filesystem::path storeFile)
    : ports_(ports),
      store_(std::make_unique<NotificationStore>(std::move(storeFile), ports.systemLog)),
      banners_(std::make_shared<Banners>(*this)) {
  ports_.notificationServer.setObserver(banners_);
  ports_.timer.setHandler([this] { recheck(); });
}

ScheduledNotificationCenter::~ScheduledNotificationCenter() {
  ports_.timer.disarm();
  ports_.timer.setHandler(nullptr);
}

void ScheduledNotificationCenter::setDelegate(
    std::weak_ptr<UserNotificationCenterDelegate> delegate) {
  delegate_ = std::move(delegate);
  recheck();
}

void ScheduledNotificationCenter::scheduleNotification(const UserNotification& notification) {
  store_->schedule(notification, ports_.clock.now(), calendar());
  recheck();
}

std::vector<UserNotification> ScheduledNotificationCenter::scheduledNotifications() {
  const Calendar present = calendar();
  std::vector<UserNotification> notifications;
  for (NotificationSchedule& schedule : store_->schedules()) {
    schedule.notification.deliveryDate = nextDate(schedule, present);
    notifications.push_back(std::move(schedule.notification));
  }
  std::stable_sort(notifications.begin(), notifications.end(),
                   [](const UserNotification& left, const UserNotification& right) {
                     return left.deliveryDate.value_or(Date::max()) <
                            right.deliveryDate.value_or(Date::max());
                   });
  return notifications;
}

void ScheduledNotificationCenter::removeScheduledNotification(
    const UserNotification& notification) {
  const Calendar present = calendar();
  for (NotificationSchedule& schedule : store_->schedules()) {
    schedule.notification.deliveryDate = nextDate(schedule, present);
    if (isSameNotification(schedule.notification, notification))
      store_->removeSchedule(schedule.key);
  }
  awaitNext();
}

void ScheduledNotificationCenter::deliverNotification(const UserNotification& notification) {
  deliver(store_->addDelivered(notification, ports_.clock.now()));
}

std::vector<UserNotification> ScheduledNotificationCenter::deliveredNotifications() {
  std::vector<UserNotification> notifications;
  for (DeliveredNotification& delivered : store_->delivered())
    notifications.push_back(std::move(delivered.notification));
  return notifications;
}

void ScheduledNotificationCenter::removeDeliveredNotification(
    const UserNotification& notification) {
  for (const DeliveredNotification& delivered : store_->delivered()) {
    if (!isSameNotification(delivered.notification, notification)) continue;
    store_->removeDelivered(delivered.key);
    banners_->close(delivered);
  }
}

void ScheduledNotificationCenter::recheck() {
  if (!delegate_.expired())
    for (const auto& delivered : store_->claimDue(ports_.clock.now(), calendar()))
      deliver(delivered);
  awaitNext();
}

void ScheduledNotificationCenter::deliver(const DeliveredNotification& delivered) {
  const auto delegate = delegate_.lock();
  if (delegate && !delegate->shouldPresent(*this, delivered.notification))
    banners_->close(delivered);
  else
    banners_->show(delivered);

  // Told later, so that a host that makes the delegate at launch can still subscribe to its events.
  ports_.mainQueue.post([banners = std::weak_ptr(banners_), listener = delegate_,
                         notification = delivered.notification] {
    const auto center = banners.lock();
    const auto told = listener.lock();
    if (center && told) told->didDeliver(center->center(), notification);
  });
}

// The user's present time zone.
Calendar ScheduledNotificationCenter::calendar() const {
  return {ports_.userLocale, ports_.timeZones};
}

void ScheduledNotificationCenter::awaitNext() {
  std::optional<Date> next;
  if (!delegate_.expired()) {
    const Calendar present = calendar();
    for (const NotificationSchedule& schedule : store_->schedules())
      if (const auto date = nextDate(schedule, present); date && (!next || *date < *next))
        next = date;
  }
  // What is still due could not be claimed: the store does not work at present.
  const Date now = ports_.clock.now();
  const bool isOutOfOrder = !delegate_.expired() && store_->isOutOfOrder();
  if (isOutOfOrder || (next && *next <= now)) next = now + retryDelay;
  if (next)
    ports_.timer.arm(*next);
  else
    ports_.timer.disarm();
}

}  // namespace Varnel::Platform
