// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Ports/UserNotificationCenter.h>
#include <Varnel/Reminders/NextDayCleanupReminderInfo.h>
#include <orvane/Console.h>
#include <orvane/RemindCommands.h>
#include <orvane/ReminderPlanner.h>
#include <orvane/Reminders.h>

namespace Orvane {

int RemindTomorrowCommand::run(Console& console) const {
  ReminderPlanner planner(console);
  // The identifier is always the same, so an earlier reminder gives way.
  const bool isPlanned = planner.plan(
      Varnel::NextDayCleanupReminderInfo(selectedSize, foundSize).makeUserNotification());
  return writeStatus(planner.center(), console) && isPlanned ? 0 : 1;
}

}  // namespace Orvane
