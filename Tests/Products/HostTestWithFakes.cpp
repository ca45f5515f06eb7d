// SPDX-License-Identifier: MIT
// A host's own test, which links the framework and its fakes alone; it prints what does not hold.
#include <chrono>
#include <iostream>

#include <Varnel/DiskAccess/DiskAccessManager.h>
#include <Varnel/DiskAccess/DiskAccessingSession.h>
#include <Varnel/Identification/User/UserIdentificator.h>
#include <Varnel/Logging/Logger.h>
#include <Varnel/Platform/Testing/FakePorts.h>
#include <Varnel/Reminders/NextDayCleanupReminderInfo.h>

using namespace Varnel;
using Platform::Testing::FakePorts;

namespace {

void check(bool holds, const char* what) {
  if (!holds) std::cout << what << std::endl;
}

}  // namespace

int main() {
  static auto& fakes = *new FakePorts;
  if (!installProcessPorts(fakes.ports())) return EXIT_FAILURE;

  fakes.volumeCatalog.mount({.url = Platform::URL::fileURLWithPath("/"), .isLocal = true});
  {
    DiskAccessManager manager(fakes.ports());
    check(manager.beginAccessingURL(Platform::URL::fileURLWithPath("/a"), "test") != nullptr,
          "the file cannot be read");
    check(fakes.volumeCatalog.subscriptionCount() == 1, "nobody hears of volumes");
  }
  check(UserIdentificator(fakes.ports()).machineUUID().has_value(), "the machine is not known");

  fakes.clock.advance(std::chrono::hours(36));
  const NextDayCleanupReminderInfo reminder(1, 2);
  check(reminder.makeUserNotification().deliveryDate == fakes.clock.now() + std::chrono::hours(24),
        "the reminder is not due in a day");
  check(reminder.makeUserNotification().title != "Varnel_NextDayCleanupReminder_Title",
        "the framework's texts are missing");
  Logger::instance().log("logged");
  check(fakes.standardOutput.text().ends_with("logged\n"), "the entry is not printed");
  std::cout << "done" << std::endl;
}
