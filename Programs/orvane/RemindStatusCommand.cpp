// SPDX-License-Identifier: MIT
#include <Varnel/Reminders/UserNotificationRouter.h>
#include <orvane/Console.h>
#include <orvane/RemindCommands.h>
#include <orvane/Reminders.h>

namespace Orvane {

int RemindStatusCommand::run(Console& console) const {
  auto& center = Varnel::UserNotificationRouter::defaultUserNotificationCenter();
  return writeStatus(center, console) ? 0 : 1;
}

}  // namespace Orvane
