// SPDX-License-Identifier: MIT
#include <memory>

#include <Varnel/Platform/Ports/MainQueue.h>
#include <Varnel/Platform/Ports/Ports.h>
#include <Varnel/Platform/Ports/UserNotificationCenter.h>
#include <Varnel/Reminders/NextDayCleanupReminderInfo.h>
#include <Varnel/Reminders/SchedulerService.h>
#include <Varnel/Reminders/UserNotificationRouter.h>
#include <Varnel/Tallyhouse/AnalyticsTracker.h>
#include <orvane/Console.h>
#include <orvane/RemindCommands.h>
#include <orvane/ReminderPlanner.h>
#include <orvane/Reminders.h>

namespace Orvane {
namespace {

using Router = Varnel::UserNotificationRouter;

const char* nameOf(Router::EventKind kind) {
  switch (kind) {
    case Router::EventKind::didLaunchWith:
      return "launched with";
    case Router::EventKind::didDeliver:
      return "delivered";
    case Router::EventKind::didActivate:
      return "clicked";
  }
  return "?";
}

}  // namespace

int RemindListenCommand::run(Console& console) const {
  // It looks on: a window of the application takes its place.
  Router router(
      {Router::defaultUserNotificationCenter(), Varnel::Platform::processPorts().application,
       Varnel::Platform::processPorts().mainQueue},
      Varnel::Platform::UserNotificationCenter::Standing::onlooker);
  Varnel::SchedulerService service(std::make_shared<Tallyhouse::AnalyticsTracker>(), router);
  const auto& nextDay = Varnel::NextDayCleanupReminderInfo::userNotificationIdentifier();
  bool isWritten = true;
  Varnel::Platform::MainQueue& mainQueue = Varnel::Platform::processPorts().mainQueue;
  const auto tell = [&](const Varnel::Platform::UserNotification& notification,
                        Router::EventKind kind) {
    isWritten = isWritten &&
                console.writeResult(nameOf(kind) + std::string("  ") + lineOf(notification) + "\n");
    if (!isWritten) mainQueue.stop();
  };
  router.register_("SchedulerNotification", tell);
  router.register_(nextDay, tell);
  router.register_(nextDay, [&](const auto& notification, Router::EventKind kind) {
    if (kind != Router::EventKind::didDeliver)
      removeClicked(router.userNotificationCenter(), notification);
  });
  // A plan that is right stays: assigning the stored period would move the reminder.
  repairPlan(service, console);
  router.handlePendingLaunch();
  router.userNotificationCenter().checkBanners([&](const auto& obstacle) {
    if (obstacle)
      console.complain("no banner can be shown at present: " + obstacle->localizedDescription());
  });
  mainQueue.run();
  return isWritten ? 0 : 1;
}

}  // namespace Orvane
