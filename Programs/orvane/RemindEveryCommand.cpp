// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Ports/UserNotificationCenter.h>
#include <orvane/Console.h>
#include <orvane/RemindCommands.h>
#include <orvane/ReminderPlanner.h>
#include <orvane/Reminders.h>

namespace Orvane {

int RemindEveryCommand::run(Console& console) const {
  // The period first: whatever stops this program, the next one repairs the plan.
  if (!storePeriod(period, console)) return 1;
  ReminderPlanner planner(console);
  const bool isPlanned = planner.planRegular(period);
  return writeStatus(planner.center(), console) && isPlanned ? 0 : 1;
}

}  // namespace Orvane
