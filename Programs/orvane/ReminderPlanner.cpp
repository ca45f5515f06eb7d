// SPDX-License-Identifier: MIT
#include <orvane/ReminderPlanner.h>

#include <algorithm>
#include <memory>
#include <vector>

#include <Varnel/Platform/Ports/MainQueue.h>
#include <Varnel/Platform/Ports/Ports.h>
#include <Varnel/Platform/Ports/UserNotificationCenter.h>
#include <Varnel/Platform/Text/Calendar.h>
#include <Varnel/Reminders/SchedulerService.h>
#include <Varnel/Reminders/UserNotificationRouter.h>
#include <Varnel/Tallyhouse/AnalyticsTracker.h>
#include <orvane/Console.h>
#include <orvane/Reminders.h>

namespace Orvane {
namespace {

using Varnel::SchedulePeriodOption;
using Varnel::Platform::UserNotification;
using Varnel::Platform::UserNotificationCenter;

/// The product's center for a program that only plans: it never becomes the delegate.
class PlanningCenter final : public UserNotificationCenter {
 public:
  explicit PlanningCenter(UserNotificationCenter& center) : center_(center) {}

  void setDelegate(std::weak_ptr<Varnel::Platform::UserNotificationCenterDelegate>,
                   Standing) override {}
  Varnel::Platform::Result<std::optional<UserNotification>> takeLaunchNotification() override {
    return std::optional<UserNotification>();
  }
  Failure change(const std::function<Failure()>& calls) override { return center_.change(calls); }
  Failure scheduleNotification(const UserNotification& notification) override {
    return center_.scheduleNotification(notification);
  }
  Notifications scheduledNotifications() override { return center_.scheduledNotifications(); }
  Failure removeScheduledNotification(const UserNotification& notification) override {
    return center_.removeScheduledNotification(notification);
  }
  Failure deliverNotification(const UserNotification& notification) override {
    return center_.deliverNotification(notification);
  }
  Notifications deliveredNotifications() override { return center_.deliveredNotifications(); }
  Failure removeDeliveredNotification(const UserNotification& notification) override {
    return center_.removeDeliveredNotification(notification);
  }
  void retryLater(std::function<void()> retry) override { center_.retryLater(std::move(retry)); }
  void checkBanners(std::function<void(const Failure&)> answer) override {
    center_.checkBanners(std::move(answer));
  }
  bool isBusy() const override { return center_.isBusy(); }

 private:
  UserNotificationCenter& center_;
};

// A reminder that is to be planned, as long as somebody holds this: the center may try again when
// the user was told that it is not planned.
struct Attempt final {
  UserNotificationCenter& center;
  const UserNotification& notification;
  UserNotificationCenter::Failure failure;

  static void make(const std::weak_ptr<Attempt>& attempt) {
    const auto held = attempt.lock();
    if (!held) return;
    held->failure = held->center.scheduleNotification(held->notification);
    if (held->failure) held->center.retryLater([attempt] { make(attempt); });
  }
};

std::string reasonOf(const std::optional<Varnel::Platform::PlatformError>& failure) {
  return failure ? failure->localizedDescription() : "it is not in the store";
}

}  // namespace

struct ReminderPlanner::Parts {
  PlanningCenter center{Varnel::UserNotificationRouter::defaultUserNotificationCenter()};
  Varnel::UserNotificationRouter router{{center, Varnel::Platform::processPorts().application,
                                         Varnel::Platform::processPorts().mainQueue}};
  Varnel::SchedulerService service{std::make_shared<Tallyhouse::AnalyticsTracker>(), router};
};

Varnel::Platform::Result<bool> isPlanned(UserNotificationCenter& center,
                                         SchedulePeriodOption period) {
  auto planned = readPatiently(center, &UserNotificationCenter::scheduledNotifications);
  if (!planned) return planned.error();
  std::erase_if(*planned, [](const auto& each) { return !each.deliveryRepeatInterval; });
  if (period == SchedulePeriodOption::never) return planned->empty();
  const auto& ports = Varnel::Platform::processPorts();
  const auto interval =
      period.repeatInterval(Varnel::Platform::Calendar(ports.userLocale, ports.timeZones));
  return planned->size() == 1 && planned->front().deliveryRepeatInterval == interval;
}

void repairPlan(Varnel::SchedulerService& service, Console& console) {
  const auto period = storedPeriod();
  // A setting that is lost is no reason to take the user's reminder away.
  if (!period) return;
  UserNotificationCenter& center = service.userNotificationCenter();
  const auto planned = isPlanned(center, *period);
  if (!planned) {
    console.complain("the reminders cannot be read yet: " + reasonOf(planned.error()));
    return center.retryLater([&] { repairPlan(service, console); });
  }
  if (*planned) return;
  service.setSchedulePeriod(*period);
  if (service.failure())
    console.complain("the regular reminder is not planned yet: " + reasonOf(service.failure()));
}

ReminderPlanner::ReminderPlanner(Console& console)
    : console_(console), parts_(std::make_unique<Parts>()) {}

ReminderPlanner::~ReminderPlanner() = default;

UserNotificationCenter& ReminderPlanner::center() const {
  return parts_->center;
}

bool ReminderPlanner::planRegular(SchedulePeriodOption period,
                                  std::optional<std::int64_t> sizeLeftToClean) {
  Varnel::SchedulerService& service = parts_->service;
  // Assigning plans anew and clears what was delivered, so only a choice of the user and a scan do.
  service.setSchedulePeriod(period);
  if (sizeLeftToClean) service.scheduleCleanReminder(*sizeLeftToClean);
  awaitDesktop([&] { return service.failure().has_value(); });
  const auto planned = isPlanned(parts_->center, period);
  const Failure failure = planned ? service.failure() : Failure(planned.error());
  if (planned && *planned) {
    if (!failure) return true;
    // It is of an earlier time, and nobody mends what looks right.
    console_.complain("the plan stays as it was: " + reasonOf(failure));
    return false;
  }
  console_.complain("the period is kept, but the reminder is not planned: " + reasonOf(failure) +
                    "; the next command that plans or listens tries again");
  return false;
}

bool ReminderPlanner::plan(const UserNotification& notification) {
  repairPlan(parts_->service, console_);
  UserNotificationCenter& center = parts_->center;
  const auto attempt = std::make_shared<Attempt>(Attempt{center, notification, {}});
  Attempt::make(attempt);
  awaitDesktop([&] { return attempt->failure.has_value(); });
  const auto planned = readPatiently(center, &UserNotificationCenter::scheduledNotifications);
  const Failure failure = planned ? attempt->failure : Failure(planned.error());
  if (planned && std::find(planned->begin(), planned->end(), notification) != planned->end())
    return true;
  console_.complain("the reminder is not planned: " + reasonOf(failure));
  return false;
}

void ReminderPlanner::awaitDesktop(const std::function<bool()>& isWaiting) const {
  Varnel::Platform::MainQueue& mainQueue = Varnel::Platform::processPorts().mainQueue;
  const UserNotificationCenter& center = parts_->center;
  mainQueue.runWhile([&] { return isWaiting() || center.isBusy(); }, patience());
  if (center.isBusy())
    console_.complain("the desktop does not answer; the banner of an earlier reminder may stay");
}

}  // namespace Orvane
