// SPDX-License-Identifier: MIT
#include <memory>

#include <Varnel/Platform/Ports/MainQueue.h>
#include <Varnel/Platform/Ports/Ports.h>
#include <Varnel/Platform/Ports/UserNotificationCenter.h>
#include <Varnel/Reminders/SchedulerService.h>
#include <Varnel/Reminders/UserNotificationRouter.h>
#include <Varnel/Tallyhouse/AnalyticsTracker.h>
#include <orvane/Console.h>
#include <orvane/RemindCommands.h>
#include <orvane/Reminders.h>

namespace Orvane {
namespace {

using Varnel::Platform::UserNotification;

/// The product's center for a program that only plans: it never becomes the delegate, for it ends
/// before it could hear of anything, and what is due waits for a program that listens.
class PlanningCenter final : public Varnel::Platform::UserNotificationCenter {
 public:
  explicit PlanningCenter(UserNotificationCenter& center) : center_(center) {}

  void setDelegate(std::weak_ptr<Varnel::Platform::UserNotificationCenterDelegate>) override {}
  void scheduleNotification(const UserNotification& notification) override {
    center_.scheduleNotification(notification);
  }
  std::vector<UserNotification> scheduledNotifications() override {
    return center_.scheduledNotifications();
  }
  void removeScheduledNotification(const UserNotification& notification) override {
    center_.removeScheduledNotification(notification);
  }
  void deliverNotification(const UserNotification& notification) override {
    center_.deliverNotification(notification);
  }
  std::vector<UserNotification> deliveredNotifications() override {
    return center_.deliveredNotifications();
  }
  void removeDeliveredNotification(const UserNotification& notification) override {
    center_.removeDeliveredNotification(notification);
  }
  bool isBusy() const override { return center_.isBusy(); }

 private:
  UserNotificationCenter& center_;
};

}  // namespace

int RemindEveryCommand::run(Console& console) const {
  const auto& ports = Varnel::Platform::processPorts();
  // The period first: the plan can be made again from it.
  if (!storePeriod(period, console)) return 1;
  PlanningCenter center(Varnel::UserNotificationRouter::defaultUserNotificationCenter());
  Varnel::UserNotificationRouter router({center, ports.application, ports.mainQueue});
  Varnel::SchedulerService service(std::make_shared<Tallyhouse::AnalyticsTracker>(), router);
  // Assigning plans anew and clears what was delivered, so only a choice of the user does it.
  service.setSchedulePeriod(period);
  awaitDesktop(center, console);
  return console.writeResult(statusText(center)) ? 0 : 1;
}

}  // namespace Orvane
