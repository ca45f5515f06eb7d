// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Ports/UserNotificationCenter.h>
#include <Varnel/Reminders/NextDayCleanupReminderInfo.h>
#include <Varnel/Reminders/UserNotificationRouter.h>
#include <orvane/Console.h>
#include <orvane/RemindCommands.h>
#include <orvane/Reminders.h>

namespace Orvane {

int RemindTomorrowCommand::run(Console& console) const {
  // Without a router: this program ends before it could hear of anything.
  auto& center = Varnel::UserNotificationRouter::defaultUserNotificationCenter();
  // The identifier is always the same, so an earlier reminder gives way.
  center.scheduleNotification(
      Varnel::NextDayCleanupReminderInfo(selectedSize, foundSize).makeUserNotification());
  awaitDesktop(center, console);
  return console.writeResult(statusText(center)) ? 0 : 1;
}

}  // namespace Orvane
