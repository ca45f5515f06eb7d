// SPDX-License-Identifier: MIT
// A host's test: no disk, no desktop, no network, and no clock to be waited for.
#include <gtest/gtest.h>

#include <chrono>
#include <optional>
#include <string>

#include <Varnel/Platform/Ports/Clock.h>
#include <Varnel/Platform/Ports/Ports.h>
#include <Varnel/Platform/Testing/FakePorts.h>
#include <Varnel/Platform/Testing/FaultPlan.h>
#include <Varnel/Reminders/UserNotificationRouter.h>

using namespace std::chrono_literals;
using Varnel::UserNotificationRouter;
using Varnel::Platform::Testing::FakePorts;
using Varnel::Platform::Testing::Fault;

// What is tested: a host's class that plans a reminder for tomorrow and hears of clicks.
class BackupReminder {
 public:
  explicit BackupReminder(const Varnel::Platform::Ports& ports)
      : clock_(ports.clock), router_(ports) {
    router_.register_("backup", [this](const auto&, auto kind) {
      isClicked = kind == UserNotificationRouter::EventKind::didActivate;
    });
  }
  bool plan() {
    return !router_.userNotificationCenter().scheduleNotification(
        {.identifier = "backup", .title = "Back up", .deliveryDate = clock_.now() + 24h});
  }
  bool isClicked = false;

 private:
  Varnel::Platform::Clock& clock_;
  UserNotificationRouter router_;
};

TEST(BackupReminder, ComesTheNextDayAndHearsOfTheClick) {
  FakePorts fakes;
  BackupReminder reminder(fakes.ports());
  ASSERT_TRUE(reminder.plan());

  auto& center = fakes.userNotificationCenters.theCenter;
  center.advanceTo(fakes.clock.now() + 25h);
  ASSERT_EQ(center.presented.size(), 1u);
  center.activate(center.presented[0]);
  fakes.mainQueue.drain();
  EXPECT_TRUE(reminder.isClicked);
}

TEST(BackupReminder, SaysWhenItCannotBeKept) {
  FakePorts fakes;
  BackupReminder reminder(fakes.ports());
  fakes.userNotificationCenters.theCenter.faults->plan(Fault::fails, 1);
  EXPECT_FALSE(reminder.plan());
}
