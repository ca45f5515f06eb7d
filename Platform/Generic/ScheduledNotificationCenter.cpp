// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Generic/ScheduledNotificationCenter.h>

#include <algorithm>
#include <charconv>
#include <deque>
#include <map>
#include <set>
#include <utility>

#include <Varnel/Platform/Generic/NotificationStore.h>
#include <Varnel/Platform/Ports/Clock.h>
#include <Varnel/Platform/Ports/MainQueue.h>
#include <Varnel/Platform/Ports/NotificationServer.h>
#include <Varnel/Platform/Ports/PrivateFiles.h>
#include <Varnel/Platform/Ports/SystemLog.h>
#include <Varnel/Platform/Ports/TimeZones.h>
#include <Varnel/Platform/Ports/UserLocale.h>
#include <Varnel/Platform/Ports/WallClockTimer.h>
#include <Varnel/Platform/Text/Calendar.h>
#include <Varnel/Platform/Values/Restorer.h>

namespace Varnel::Platform {
namespace {

using enum DeliveryState;

Banner bannerOf(const UserNotification& notification) {
  return {.title = notification.title.value_or(""),
          .text = notification.informativeText.value_or(""),
          .actionTitle = notification.actionButtonTitle.value_or(""),
          .dismissTitle = notification.otherButtonTitle.value_or("")};
}

}  // namespace

// Brings the desktop's banners in step with the store, and notes in the store what becomes of them.
// What could not be noted is kept and noted later, in order, so that no banner is shown twice. It
// ends with its center; weak references to it then find it gone.
class ScheduledNotificationCenter::Banners final : public NotificationServer::Observer {
 public:
  explicit Banners(ScheduledNotificationCenter& center) : center_(center) {}

  void bannerShown(const std::string& token, const std::string& reference) override {
    const std::int64_t number = numberOf(token);
    note([this, number, token, reference]() -> Failure {
      const auto isThere = center_.store_->noteShown(number, reference);
      if (!isThere) return isThere.error();
      // It was removed while the server was busy showing it.
      if (!*isThere) server().close(token, reference);
      return std::nullopt;
    });
  }
  void bannerFailed(const std::string& token) override {
    const std::int64_t number = numberOf(token);
    shown_.erase(number);
    closing_.erase(number);
    failed_.insert(number);
    center_.recheck();
  }
  void bannerActivated(const std::string& token, const BannerActivation&) override {
    const auto shown = shown_.extract(numberOf(token));
    if (!shown) return;
    bannerGone(token);
    if (const auto delegate = center_.delegate_.lock())
      delegate->didActivate(center_, shown.mapped());
  }
  void bannerDismissed(const std::string& token) override {
    const std::int64_t number = numberOf(token);
    shown_.erase(number);
    note([this, number] {
      return center_.store_->change([&] {
        auto error = center_.store_->noteGone(number);
        return error ? error : center_.store_->remove(number);
      });
    });
  }
  void bannerGone(const std::string& token) override {
    const std::int64_t number = numberOf(token);
    closing_.erase(number);
    note([this, number] { return center_.store_->noteGone(number); });
  }
  void serverAppeared() override {
    failed_.clear();
    center_.recheck();
  }

  /// Notes what could not be noted before.
  Failure catchUp() {
    while (!notes_.empty()) {
      if (auto error = notes_.front()()) return error;
      notes_.pop_front();
    }
    return std::nullopt;
  }

  /// Shows and closes what the store says. Only the deliverer shows.
  Failure follow() {
    const auto all = center_.store_->deliveries({hidden, toShow, shown, expired, removed});
    if (!all) return all.error();
    std::set<std::int64_t> present;
    // The earliest first, as they came due.
    for (auto each = all->rbegin(); each != all->rend(); ++each) {
      present.insert(each->number);
      if (failed_.contains(each->number)) continue;
      if (each->state == toShow && !shown_.contains(each->number))
        if (auto error = show(*each)) return error;
      if ((each->state == hidden || each->state == removed) && each->banner) close(*each);
    }
    std::erase_if(shown_, [&](const auto& each) {
      if (present.contains(each.first)) return false;
      server().close(std::to_string(each.first), std::nullopt);
      return true;
    });
    return std::nullopt;
  }

  bool hasFailed() const { return !failed_.empty(); }
  void tryFailedAgain() { failed_.clear(); }

  ScheduledNotificationCenter& center() const { return center_; }

 private:
  NotificationServer& server() const { return center_.ports_.notificationServer; }

  static std::int64_t numberOf(const std::string& token) {
    std::int64_t number = 0;
    std::from_chars(token.data(), token.data() + token.size(), number);
    return number;
  }

  void note(std::function<Failure()> work) {
    notes_.push_back(std::move(work));
    center_.recheck();
  }

  Failure show(const Delivery& delivery) {
    if (auto error = center_.becomeDeliverer()) return error;
    if (!center_.delivererLock_) return std::nullopt;
    shown_.emplace(delivery.number, delivery.schedule.notification);
    server().show(std::to_string(delivery.number), bannerOf(delivery.schedule.notification),
                  delivery.banner);
    return std::nullopt;
  }

  void close(const Delivery& delivery) {
    shown_.erase(delivery.number);
    if (closing_.insert(delivery.number).second)
      server().close(std::to_string(delivery.number), delivery.banner);
  }

  ScheduledNotificationCenter& center_;
  std::map<std::int64_t, UserNotification> shown_;  ///< By this process, or about to be.
  std::set<std::int64_t> closing_;
  std::set<std::int64_t> failed_;  ///< Left alone until the next try.
  std::deque<std::function<Failure()>> notes_;
};

ScheduledNotificationCenter::ScheduledNotificationCenter(Ports ports, const std::string& storeFile)
    : ports_(ports),
      lockFile_(storeFile + ".deliverer"),
      store_(std::make_unique<NotificationStore>(
          DurableFile::Ports{ports.privateFiles, ports.systemLog}, storeFile)),
      banners_(std::make_shared<Banners>(*this)) {
  // The folder is there from now on, so that somebody may watch it.
  static_cast<void>(ports_.privateFiles.prepare(lockFile_));
  ports_.notificationServer.setObserver(banners_);
  ports_.timer.setHandler([this] { tick(); });
}

ScheduledNotificationCenter::~ScheduledNotificationCenter() {
  ports_.timer.disarm();
  ports_.timer.setHandler(nullptr);
}

void ScheduledNotificationCenter::setDelegate(
    std::weak_ptr<UserNotificationCenterDelegate> delegate, Standing) {
  delegate_ = std::move(delegate);
  recheck();
}

UserNotificationCenter::Failure ScheduledNotificationCenter::change(
    const std::function<Failure()>& calls) {
  Failure error;
  {
    const Restorer occupied(isOccupied_);
    Restorer asked(isAskedToDeliver_);
    isOccupied_ = true;
    error = store_->change(calls);
    if (!error) asked.dismiss();
  }
  recheck();
  return error;
}

UserNotificationCenter::Failure ScheduledNotificationCenter::scheduleNotification(
    const UserNotification& notification) {
  auto error = store_->plan(notification, ports_.clock.now(), calendar());
  recheck();
  return error;
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
  return removeThose(notification, false);
}

UserNotificationCenter::Failure ScheduledNotificationCenter::deliverNotification(
    const UserNotification& notification) {
  auto error = store_->makeDue(notification, ports_.clock.now());
  if (!error) isAskedToDeliver_ = true;
  recheck();
  return error;
}

UserNotificationCenter::Notifications ScheduledNotificationCenter::deliveredNotifications() {
  auto delivered = store_->deliveries({hidden, toShow, shown, expired});
  if (!delivered) return delivered.error();
  std::vector<UserNotification> notifications;
  for (Delivery& delivery : *delivered)
    notifications.push_back(std::move(delivery.schedule.notification));
  return notifications;
}

UserNotificationCenter::Failure ScheduledNotificationCenter::removeDeliveredNotification(
    const UserNotification& notification) {
  return removeThose(notification, true);
}

UserNotificationCenter::Failure ScheduledNotificationCenter::removeThose(
    const UserNotification& notification, bool isDelivered) {
  const Calendar present = calendar();
  return change([&]() -> Failure {
    // What is due has its delivery ahead as well.
    const auto candidates = store_->deliveries(
        isDelivered ? std::vector{hidden, toShow, shown, expired} : std::vector{planned, due});
    if (!candidates) return candidates.error();
    for (const Delivery& each : *candidates) {
      UserNotification candidate = each.schedule.notification;
      if (!isDelivered) candidate.actualDeliveryDate.reset();
      if (each.state == planned) candidate.deliveryDate = nextDate(each.schedule, present);
      if (isSameNotification(candidate, notification))
        if (auto error = store_->remove(each.number)) return error;
    }
    return std::nullopt;
  });
}

void ScheduledNotificationCenter::retryLater(std::function<void()> retry) {
  retries_.push_back(std::move(retry));
  if (!isOccupied_) awaitNext();
}

void ScheduledNotificationCenter::checkBanners(
    std::function<void(const Failure& obstacle)> answer) {
  ports_.notificationServer.check(std::move(answer));
}

void ScheduledNotificationCenter::recheck() {
  if (isOccupied_) return;
  {
    const Restorer occupied(isOccupied_);
    isOccupied_ = true;
    isBehind_ = false;
    Failure failure = banners_->catchUp();
    if (!failure) failure = deliverDue();
    if (!failure) failure = banners_->follow();
    report(failure);
    isBehind_ = isBehind_ || failure || banners_->hasFailed();
  }
  awaitNext();
}

// A host whose delegate plans when it is asked finds this busy; the timer comes to that.
UserNotificationCenter::Failure ScheduledNotificationCenter::deliverDue() {
  if (!mayDeliver()) {
    if (!isBusy()) delivererLock_.reset();
    return std::nullopt;
  }
  const auto waiting = store_->deliveries({planned, due});
  if (!waiting) return waiting.error();
  const Date now = ports_.clock.now();
  const Calendar present = calendar();
  const bool isAnyDue = std::any_of(waiting->begin(), waiting->end(), [&](const Delivery& each) {
    return each.state == due || nextDate(each.schedule, present).value_or(Date::max()) <= now;
  });
  if (isAnyDue) {
    if (auto error = becomeDeliverer()) return error;
    if (!delivererLock_) return std::nullopt;
  }
  if (!delegate_.expired())
    if (auto error = store_->claimDue(now, present)) return error;
  return decideDue();
}

UserNotificationCenter::Failure ScheduledNotificationCenter::decideDue() {
  const auto claimed = store_->deliveries({due});
  if (!claimed) return claimed.error();
  if (claimed->empty()) return std::nullopt;
  std::vector<std::pair<std::int64_t, bool>> isToShow;
  const auto delegate = delegate_.lock();
  for (auto each = claimed->rbegin(); each != claimed->rend(); ++each)
    isToShow.emplace_back(each->number,
                          !delegate || delegate->shouldPresent(*this, each->schedule.notification));
  if (auto error = store_->decideDue(isToShow)) return error;
  for (auto each = claimed->rbegin(); each != claimed->rend(); ++each)
    tellDelivered(each->schedule.notification);
  return std::nullopt;
}

// Told later, so that a host that makes the delegate at launch can still subscribe to its events.
void ScheduledNotificationCenter::tellDelivered(const UserNotification& notification) {
  ports_.mainQueue.post([banners = std::weak_ptr(banners_), listener = delegate_, notification] {
    const auto center = banners.lock();
    const auto told = listener.lock();
    if (center && told) told->didDeliver(center->center(), notification);
  });
}

// Succeeds also where another process is the deliverer.
UserNotificationCenter::Failure ScheduledNotificationCenter::becomeDeliverer() {
  if (delivererLock_ || !mayDeliver()) return std::nullopt;
  auto lock = ports_.privateFiles.tryLock(lockFile_);
  if (!lock) return lock.error();
  delivererLock_ = std::move(*lock);
  // The other one may end before it has done everything.
  if (!delivererLock_) isBehind_ = true;
  return std::nullopt;
}

void ScheduledNotificationCenter::report(const Failure& failure) {
  const std::string text = failure ? failure->localizedDescription() : "";
  if (failure && text != lastReport_) ports_.systemLog.write("Notifications have to wait: " + text);
  lastReport_ = text;
}

// The user's present time zone.
Calendar ScheduledNotificationCenter::calendar() const {
  return {ports_.userLocale, ports_.timeZones};
}

void ScheduledNotificationCenter::tick() {
  if (isToRetry_ && pause_.isOver(ports_.clock.now())) {
    isToRetry_ = false;
    banners_->tryFailedAgain();
    for (const auto& retry : std::exchange(retries_, {})) retry();
  }
  recheck();
}

void ScheduledNotificationCenter::awaitNext() {
  const Date now = ports_.clock.now();
  std::optional<Date> next;
  if (!delegate_.expired()) {
    const auto waiting = store_->deliveries({planned});
    if (!waiting) isBehind_ = true;
    const Calendar present = calendar();
    for (const Delivery& each : waiting ? *waiting : std::vector<Delivery>()) {
      const auto date = nextDate(each.schedule, present);
      // What is due and was not claimed waits for the next try.
      if (!date || (*date <= now && isBehind_)) continue;
      next = std::min(next.value_or(Date::max()), *date);
    }
  }
  if (isBehind_ || !retries_.empty()) {
    if (!std::exchange(isToRetry_, true)) pause_.failed(now);
    next = std::min(next.value_or(Date::max()), pause_.end());
  } else {
    isToRetry_ = false;
    if (!isBusy()) pause_.succeeded();
  }
  if (next)
    ports_.timer.arm(*next);
  else
    ports_.timer.disarm();
}

}  // namespace Varnel::Platform
