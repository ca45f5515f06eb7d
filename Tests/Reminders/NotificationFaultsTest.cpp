// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Generic/ScheduledNotificationCenter.h>

#include <gtest/gtest.h>

#include <memory>

#include <Tests/Support/TemporaryFolder.h>
#include <Tests/Support/Zones.h>
#include <Varnel/Platform/POSIX/Adapters.h>
#include <Varnel/Platform/Testing/CapturedOutput.h>
#include <Varnel/Platform/Testing/FakeMainQueue.h>
#include <Varnel/Platform/Testing/FakeNotificationServer.h>
#include <Varnel/Platform/Testing/FakeUser.h>
#include <Varnel/Platform/Testing/FakeWallClockTimer.h>
#include <Varnel/Platform/Testing/FaultyPrivateFiles.h>

namespace Varnel::Platform {
namespace {

using namespace std::chrono;
using namespace std::chrono_literals;
using Testing::Fault;

constexpr Date start = sys_days(2026y / March / 1) + 8h;

struct Anybody final : UserNotificationCenterDelegate {
  void didDeliver(UserNotificationCenter&, const UserNotification&) override {}
  void didActivate(UserNotificationCenter&, const UserNotification&) override {}
  bool shouldPresent(UserNotificationCenter&, const UserNotification&) override { return true; }
};

// A process on a machine whose store and desktop go wrong by one plan.
struct Machine {
  explicit Machine(const std::shared_ptr<Testing::FaultPlan>& faults) {
    files.faults = server.faults = faults;
    center.setDelegate(delegate);
  }

  void advanceTo(Date date) {
    timer.advanceTo(date);
    server.report();
  }

  const Tests::TemporaryFolder folder = Tests::TemporaryFolder::inMemory();
  Testing::SimulatedClock clock{start};
  Testing::FakeUserLocale locale;
  Testing::FakeTimeZones zones = Tests::zonesOf2026();
  Testing::FakeMainQueue queue;
  const std::unique_ptr<PrivateFiles> realFiles = POSIX::makePrivateFiles();
  Testing::FaultyPrivateFiles files{*realFiles};
  Testing::CapturedSystemLog log;
  Testing::FakeNotificationServer server;
  Testing::FakeWallClockTimer timer{clock};
  ScheduledNotificationCenter center{{clock, locale, zones, queue, files, log, server, timer},
                                     (folder.path() / "store.sqlite").string()};
  const std::shared_ptr<Anybody> delegate = std::make_shared<Anybody>();
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
            const bool isPromised = !machine.center.scheduleNotification(
                {.identifier = "once", .title = "Once", .deliveryDate = start + 1h});
            machine.advanceTo(start + 1h);
            machine.advanceTo(start + 2h);
            faults->mend();
            machine.advanceTo(start + 2h + ScheduledNotificationCenter::maxPause);
            machine.advanceTo(start + days(1));
            const std::size_t shown = machine.server.history().size();
            EXPECT_TRUE(shown == 1 || (shown == 0 && !isPromised)) << shown << machine.log.text();
            const auto delivered = machine.center.deliveredNotifications();
            ASSERT_TRUE(delivered);
            EXPECT_EQ(delivered->size(), shown);
            const auto scheduled = machine.center.scheduledNotifications();
            ASSERT_TRUE(scheduled);
            EXPECT_TRUE(scheduled->empty());
          },
          count);
      EXPECT_GE(calls, 20u);
    }
}

}  // namespace
}  // namespace Varnel::Platform
