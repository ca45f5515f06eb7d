// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Generic/ScheduledNotificationCenter.h>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <functional>
#include <memory>
#include <optional>

#include <Tests/Reminders/CenterProcess.h>
#include <Tests/Support/TemporaryFolder.h>
#include <Varnel/Platform/SQLite/SQLiteDatabase.h>

namespace Varnel::Platform {
namespace {

using Testing::Process;
using namespace std::chrono;
using namespace std::chrono_literals;
using ::testing::ElementsAre;
using ::testing::IsEmpty;
using ::testing::SizeIs;

constexpr Date start = sys_days(2026y / March / 1) + 8h;
constexpr auto week = days(7);

class ScheduledNotificationCenterTest : public ::testing::Test {
 protected:
  static UserNotification weekly(Date first = start + week) {
    return {.identifier = "weekly",
            .title = "Week",
            .informativeText = "Text",
            .actionButtonTitle = "Do",
            .otherButtonTitle = "Later",
            .deliveryDate = first,
            .deliveryRepeatInterval = DateComponents{.day = 7}};
  }
  static constexpr const char* title = "Week";

  const Tests::TemporaryFolder folder;
  const std::filesystem::path file = folder.path() / "store.sqlite";
  Process process{file, start};
};

TEST_F(ScheduledNotificationCenterTest, AYearAwakeDeliversEveryWeek) {
  process.zones.local = "Europe/Berlin";
  process.listen();
  process.schedule(weekly());
  process.timer.advanceTo(start + days(364));
  EXPECT_THAT(process.server.history(), SizeIs(52));
  EXPECT_THAT(process.delivered(), SizeIs(1));
  EXPECT_THAT(process.scheduled(), SizeIs(1));
  process.queue.drain();
  EXPECT_THAT(process.listener->events, SizeIs(52));
  EXPECT_EQ(
      process.server.banners().at(title),
      (Banner{.title = "Week", .text = "Text", .actionTitle = "Do", .dismissTitle = "Later"}));
}

TEST_F(ScheduledNotificationCenterTest, AMoveToAnotherZoneKeepsTheTimeOfDay) {
  process.zones.local = "Europe/Berlin";
  process.listen();
  process.schedule(weekly());
  process.zones.local = "Asia/Tokyo";
  process.deliverer.changed();
  EXPECT_EQ(process.timer.armedDate(), start + week - 8h);
  EXPECT_EQ(process.scheduled().at(0).deliveryDate, start + week - 8h);
}

TEST_F(ScheduledNotificationCenterTest, WhatCameDueBeforeTheLaunchIsDeliveredOnceToTheDelegate) {
  process.schedule(weekly());
  Process next(file, start + 5 * week + 1h);
  EXPECT_THAT(next.delivered(), IsEmpty());
  EXPECT_EQ(next.timer.armedDate(), std::nullopt);
  next.listen();
  EXPECT_THAT(next.delivered(), SizeIs(1));
  EXPECT_THAT(next.server.history(), SizeIs(1));
  // The delegate's own subscribers come after it.
  EXPECT_THAT(next.listener->events, IsEmpty());
  next.queue.drain();
  EXPECT_THAT(next.listener->events, ElementsAre("delivered Week"));
  next.listen();
  EXPECT_THAT(next.server.history(), SizeIs(1));
}

TEST_F(ScheduledNotificationCenterTest, ClicksComeBackOnceAndDismissalLeavesTheList) {
  process.listen();
  process.schedule(weekly());
  process.timer.advanceTo(start + week);
  process.settle();
  process.server.activate(title);
  process.server.activate(title);
  EXPECT_THAT(process.listener->events, ElementsAre("delivered Week", "activated Week"));
  EXPECT_THAT(process.delivered(), SizeIs(1));

  process.timer.advanceTo(start + 2 * week);
  process.server.dismiss(title);
  process.settle();
  EXPECT_THAT(process.delivered(), IsEmpty());
  EXPECT_THAT(process.scheduled(), SizeIs(1));
}

TEST_F(ScheduledNotificationCenterTest, ANewDeliveryTakesThePlaceOfTheBannerOfAnEarlierRun) {
  std::optional<Process> run(std::in_place, file, start);
  run->listen();
  run->schedule(weekly());
  run->timer.advanceTo(start + week);
  run->settle();
  const auto desktop = run->desktop;
  run.emplace(file, start + week + 1h, desktop);
  run->listen();
  // Its successor takes the place only when it comes.
  run->schedule(weekly(start + 3 * week));
  EXPECT_THAT(run->delivered(), SizeIs(1));
  run->timer.advanceTo(start + 3 * week);
  run->settle();
  EXPECT_THAT(run->delivered(), SizeIs(1));
  EXPECT_THAT(run->server.history(), SizeIs(2));
  EXPECT_EQ(run->server.count(), 1u);
  // A process that only plans takes the banner away as well.
  Process planner(file, start + 3 * week, desktop);
  EXPECT_FALSE(planner.center.removeDeliveredNotification(weekly()));
  planner.settle();
  EXPECT_EQ(planner.server.count(), 0u);
  EXPECT_EQ(run->log.text(), "");
}

TEST_F(ScheduledNotificationCenterTest, ADeliveryWhileTheLastIsOnItsWayLeavesOneBanner) {
  process.listen();
  for (int i = 0; i < 3; ++i) process.deliver(weekly());
  process.settle();
  EXPECT_EQ(process.server.count(), 1u);
  process.deliver(weekly());
  EXPECT_FALSE(process.center.removeDeliveredNotification(weekly()));
  process.settle();
  EXPECT_EQ(process.server.count(), 0u);
  EXPECT_THAT(process.delivered(), IsEmpty());
  EXPECT_FALSE(process.center.isBusy());
}

TEST_F(ScheduledNotificationCenterTest, NotPresentedMeansListedAndToldAllTheSameButNeverShown) {
  process.listen();
  process.deliver(weekly());
  process.settle();
  process.queue.drain();
  process.listener->events.clear();
  process.listener->presents = false;
  process.deliver(weekly());
  process.queue.drain();
  EXPECT_EQ(process.server.count(), 0u);  // The banner that it would have replaced.
  EXPECT_THAT(process.listener->events, ElementsAre("delivered Week"));
  EXPECT_THAT(process.delivered(), SizeIs(1));
  process.settle();
  process.listener->presents = true;
  process.server.appear();
  EXPECT_THAT(process.server.history(), SizeIs(1));
}

TEST_F(ScheduledNotificationCenterTest, WithoutADelegateWhatIsDueWaits) {
  process.listen();
  process.schedule(weekly());
  process.center.setDelegate({});
  EXPECT_EQ(process.timer.armedDate(), std::nullopt);
  process.clock.set(start + week);
  process.deliverer.changed();
  EXPECT_THAT(process.server.history(), IsEmpty());
  process.deliver({.title = "Now"});
  EXPECT_THAT(process.server.history(), SizeIs(1));
  process.listen();
  EXPECT_THAT(process.server.history(), SizeIs(2));
}

TEST_F(ScheduledNotificationCenterTest, AClockSetBackPutsNoRetryOff) {
  process.listen();
  process.schedule(weekly());
  process.server.faults->plan(Testing::Fault::fails, 1);
  process.timer.advanceTo(start + week);
  process.settle();
  process.server.faults->mend();
  process.timer.setClock(start);
  process.settle();
  EXPECT_THAT(process.server.history(), SizeIs(1));
}

TEST_F(ScheduledNotificationCenterTest, AHostThatEndsBeforeTheServerHasAnsweredShowsItAgain) {
  std::optional<Process> run(std::in_place, file, start);
  run->listen();
  run->deliver(weekly());
  ASSERT_THAT(run->server.history(), SizeIs(1));  // And no report: the server hangs.
  run.emplace(file, start + 1min);
  run->listen();
  EXPECT_THAT(run->server.history(), SizeIs(1));
  run->settle();
  // What was shown and expired, or lost its server, is not shown again.
  run->server.disappear();
  run->server.appear();
  run->settle();
  EXPECT_THAT(run->server.history(), SizeIs(1));
  EXPECT_THAT(run->delivered(), SizeIs(1));
}

// The store is at fault when the banner is up: that is noted later, and no banner comes twice.
TEST_F(ScheduledNotificationCenterTest, WhatCannotBeNotedIsNotedLater) {
  process.listen();
  process.deliver(weekly());
  auto holder = SQLiteDatabase::open(file.string());
  ASSERT_FALSE(holder->execute("BEGIN EXCLUSIVE"));
  process.settle();
  process.server.dismiss(title);
  process.timer.advanceTo(start + 10s);
  ASSERT_FALSE(holder->execute("COMMIT"));
  process.timer.advanceTo(start + 10min);
  process.settle();
  EXPECT_THAT(process.server.history(), SizeIs(1));
  EXPECT_THAT(process.delivered(), IsEmpty());
}

// Only a delivery that was promised makes a program without a delegate show banners.
TEST_F(ScheduledNotificationCenterTest, ADeliveryThatFailsMakesNoDeliverer) {
  {
    Process other(file, start);
    other.listen();
    other.deliver(weekly());  // Its banner has yet to come.
  }
  const auto deliver = [&] { return process.center.deliverNotification(weekly()); };
  auto holder = SQLiteDatabase::open(file.string());
  ASSERT_FALSE(holder->execute("BEGIN EXCLUSIVE"));
  EXPECT_TRUE(deliver());
  ASSERT_FALSE(holder->execute("COMMIT"));
  const auto change = [&](const std::function<UserNotificationCenter::Failure()>& end) {
    return process.center.change([&] {
      EXPECT_FALSE(deliver());
      return end();
    });
  };
  EXPECT_TRUE(change([] { return PlatformError("Test", 1); }));
  EXPECT_THROW(static_cast<void>(change([]() -> UserNotificationCenter::Failure { throw 1; })),
               int);
  process.timer.advanceTo(start + 1h);
  EXPECT_THAT(process.server.history(), IsEmpty());
  EXPECT_FALSE(change([] { return std::nullopt; }));
  EXPECT_THAT(process.server.history(), SizeIs(1));
  // What is delivered can still be called off.
  EXPECT_FALSE(process.center.change([&] {
    EXPECT_FALSE(process.center.deliverNotification({.title = "Never"}));
    return process.center.removeDeliveredNotification({.title = "Never"});
  }));
  EXPECT_THAT(process.server.history(), SizeIs(1));
}

}  // namespace
}  // namespace Varnel::Platform
