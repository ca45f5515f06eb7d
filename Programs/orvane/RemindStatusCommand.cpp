// SPDX-License-Identifier: MIT
#include <Varnel/Reminders/UserNotificationRouter.h>
#include <orvane/Console.h>
#include <orvane/RemindCommands.h>
#include <orvane/ReminderPlanner.h>
#include <orvane/Reminders.h>

namespace Orvane {

int RemindStatusCommand::run(Console& console) const {
  auto& center = Varnel::UserNotificationRouter::defaultUserNotificationCenter();
  if (!writeStatus(center, console)) return 1;
  const auto period = storedPeriod();
  if (period && !isPlanned(center, *period).valueOr(true))
    console.complain(
        "the plan is not that of the period; the next command that plans or listens mends it");
  return 0;
}

}  // namespace Orvane
