// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>

#include <memory>

#include <Tests/Reminders/CenterProcess.h>
#include <Tests/Support/TemporaryFolder.h>

namespace Varnel::Platform {
namespace {

using namespace std::chrono;
using namespace std::chrono_literals;
using Testing::Fault;

constexpr Date start = sys_days(2026y / March / 1) + 8h;

// A process on a machine whose store and desktop go wrong by one plan.
struct Machine {
  explicit Machine(const std::shared_ptr<Testing::FaultPlan>& faults) {
    process.files.faults = process.server.faults = faults;
    process.listen();
  }

  void advanceTo(Date date) {
    process.timer.advanceTo(date);
    process.settle();
  }

  const Tests::TemporaryFolder folder = Tests::TemporaryFolder::inMemory();
  Testing::Process process{folder.path() / "store.sqlite", start};
};

// What was promised comes once, sooner or later. What was refused comes once at most: a store that
// goes away between its commit and its answer cannot tell.
TEST(NotificationFaults, LoseNoReminderThatWasPromised) {
  for (const Fault fault : {Fault::fails, Fault::absent})
    for (const std::size_t count : {1u, 3u}) {
      const auto calls = Testing::sweepFaults(
          fault,
          [&](const auto& faults) {
            Machine machine(faults);
            const bool isPromised = !machine.process.center.scheduleNotification(
                {.identifier = "once", .title = "Once", .deliveryDate = start + 1h});
            machine.advanceTo(start + 1h);
            machine.advanceTo(start + 2h);
            faults->mend();
            machine.advanceTo(start + 2h + ScheduledNotificationCenter::maxPause);
            machine.advanceTo(start + days(1));
            const std::size_t shown = machine.process.server.history().size();
            EXPECT_TRUE(shown == 1 || (shown == 0 && !isPromised))
                << shown << machine.process.log.text();
            const auto delivered = machine.process.center.deliveredNotifications();
            ASSERT_TRUE(delivered);
            EXPECT_EQ(delivered->size(), shown);
            const auto scheduled = machine.process.center.scheduledNotifications();
            ASSERT_TRUE(scheduled);
            EXPECT_TRUE(scheduled->empty());
          },
          count);
      EXPECT_GE(calls, 20u);
    }
}

}  // namespace
}  // namespace Varnel::Platform
