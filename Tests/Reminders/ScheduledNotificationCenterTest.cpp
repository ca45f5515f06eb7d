// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Generic/NotificationStore.h>
#include <Varnel/Platform/Generic/ScheduledNotificationCenter.h>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <Tests/Support/TemporaryFolder.h>
#include <Tests/Support/Zones.h>
#include <Varnel/Platform/Testing/CapturedOutput.h>
#include <Varnel/Platform/Testing/FakeMainQueue.h>
#include <Varnel/Platform/Testing/FakeNotificationServer.h>
#include <Varnel/Platform/Testing/FakeUser.h>
#include <Varnel/Platform/Testing/FakeWallClockTimer.h>

namespace Varnel::Platform {
namespace {

using namespace std::chrono;
using namespace std::chrono_literals;
using ::testing::ElementsAre;
using ::testing::IsEmpty;
using ::testing::SizeIs;

constexpr Date start = sys_days(2026y / March / 1) + 8h;
constexpr auto week = days(7);

class Listener final : public UserNotificationCenterDelegate {
 public:
  bool presents = true;
  std::vector<std::string> events;

  void didDeliver(UserNotificationCenter&, const UserNotification& notification) override {
    events.push_back("delivered " + *notification.title);
  }
  void didActivate(UserNotificationCenter&, const UserNotification& notification) override {
    events.push_back("activated " + *notification.title);
  }
  bool shouldPresent(UserNotificationCenter&, const UserNotification&) override { return presents; }
};

// A process of the product, on the store that all share.
struct Process {
  explicit Process(const std::filesystem::path& file, Date now)
      : clock(now), center({clock, locale, zones, queue, log, server, timer}, file) {}

  void listen() { center.setDelegate(listener); }

  Testing::SimulatedClock clock;
  Testing::FakeUserLocale locale;
  Testing::FakeTimeZones zones = Tests::zonesOf2026();
  Testing::FakeMainQueue queue;
  Testing::CapturedSystemLog log;
  Testing::FakeNotificationServer server;
  Testing::FakeWallClockTimer timer{clock};
  ScheduledNotificationCenter center;
  const std::shared_ptr<Listener> listener = std::make_shared<Listener>();
};

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
  static constexpr const char* token = "identifier weekly";

  const Tests::TemporaryFolder folder;
  const std::filesystem::path file = folder.path() / "store.sqlite";
  Process process{file, start};
};

TEST_F(ScheduledNotificationCenterTest, AYearAwakeDeliversEveryWeek) {
  process.zones.local = "Europe/Berlin";
  process.listen();
  process.center.scheduleNotification(weekly());
  process.timer.advanceTo(start + days(364));
  EXPECT_THAT(process.server.history(), SizeIs(52));
  EXPECT_THAT(process.center.deliveredNotifications(), SizeIs(1));
  EXPECT_THAT(process.center.scheduledNotifications(), SizeIs(1));
  process.queue.drain();
  EXPECT_THAT(process.listener->events, SizeIs(52));
  EXPECT_EQ(
      process.server.banners().at(token),
      (Banner{.title = "Week", .text = "Text", .actionTitle = "Do", .dismissTitle = "Later"}));
}

TEST_F(ScheduledNotificationCenterTest, AClockSetBackDeliversNothingTwice) {
  process.listen();
  process.center.scheduleNotification(weekly());
  process.timer.advanceTo(start + 2 * week);
  process.timer.setClock(start + week - 1h);
  process.timer.advanceTo(start + 3 * week - 1s);
  EXPECT_THAT(process.server.history(), SizeIs(2));
  process.timer.advanceTo(start + 3 * week);
  EXPECT_THAT(process.server.history(), SizeIs(3));
}

TEST_F(ScheduledNotificationCenterTest, AMoveToAnotherZoneKeepsTheTimeOfDay) {
  process.zones.local = "Europe/Berlin";
  process.listen();
  process.center.scheduleNotification(weekly());
  process.zones.local = "Asia/Tokyo";
  process.center.recheck();
  EXPECT_EQ(process.timer.armedDate(), start + week - 8h);
  EXPECT_EQ(process.center.scheduledNotifications().at(0).deliveryDate, start + week - 8h);
}

TEST_F(ScheduledNotificationCenterTest, WhatCameDueBeforeTheLaunchIsDeliveredOnceToTheDelegate) {
  process.center.scheduleNotification(weekly());
  Process next(file, start + 5 * week + 1h);
  EXPECT_THAT(next.center.deliveredNotifications(), IsEmpty());
  EXPECT_EQ(next.timer.armedDate(), std::nullopt);
  next.listen();
  EXPECT_THAT(next.center.deliveredNotifications(), SizeIs(1));
  EXPECT_THAT(next.server.history(), SizeIs(1));
  // The delegate's own subscribers come after it.
  EXPECT_THAT(next.listener->events, IsEmpty());
  next.queue.drain();
  EXPECT_THAT(next.listener->events, ElementsAre("delivered Week"));
  next.listen();
  EXPECT_THAT(next.server.history(), SizeIs(1));
}

TEST_F(ScheduledNotificationCenterTest, TwoProcessesNeverDeliverTheSame) {
  Process other(file, start);
  process.listen();
  other.listen();
  process.center.scheduleNotification(weekly());
  other.center.recheck();  // What the watch on the store does.
  ASSERT_EQ(other.timer.armedDate(), start + week);
  for (int i = 1; i <= 10; ++i) {
    Process& first = i % 2 == 0 ? process : other;
    Process& second = i % 2 == 0 ? other : process;
    first.timer.advanceTo(start + i * week);
    second.timer.advanceTo(start + i * week);
  }
  EXPECT_EQ(process.server.history().size() + other.server.history().size(), 10u);
}

TEST_F(ScheduledNotificationCenterTest, ClicksComeBackOnceAndDismissalLeavesTheList) {
  process.listen();
  process.center.scheduleNotification(weekly());
  process.timer.advanceTo(start + week);
  process.server.report();
  process.server.activate(token);
  process.server.activate(token);
  process.queue.drain();
  EXPECT_THAT(process.listener->events, ElementsAre("activated Week", "delivered Week"));
  EXPECT_THAT(process.center.deliveredNotifications(), SizeIs(1));

  process.timer.advanceTo(start + 2 * week);
  process.server.dismiss(token);
  EXPECT_THAT(process.center.deliveredNotifications(), IsEmpty());
  EXPECT_THAT(process.center.scheduledNotifications(), SizeIs(1));
}

TEST_F(ScheduledNotificationCenterTest, ALaterRunTakesTheBannerOfAnEarlierOneAway) {
  process.listen();
  process.center.scheduleNotification(weekly());
  process.timer.advanceTo(start + week);
  process.server.report();
  // The desktop outlives the process.
  Process next(file, start + week + 1h);
  const auto delivered = next.center.deliveredNotifications();
  ASSERT_THAT(delivered, SizeIs(1));
  ASSERT_THAT(process.server.banners(), SizeIs(1));
  NotificationStore store(file, process.log);
  ASSERT_EQ(store.delivered().at(0).bannerReference, "1");
  // Its successor takes the place only when it comes.
  process.center.scheduleNotification(weekly(start + 3 * week));
  EXPECT_THAT(process.center.deliveredNotifications(), SizeIs(1));
  EXPECT_THAT(process.server.banners(), SizeIs(1));
  process.timer.advanceTo(start + 3 * week);
  EXPECT_THAT(process.center.deliveredNotifications(), SizeIs(1));
  EXPECT_THAT(process.server.history(), SizeIs(2));
  process.center.removeDeliveredNotification(weekly());
  EXPECT_THAT(process.server.banners(), IsEmpty());
}

TEST_F(ScheduledNotificationCenterTest, NotPresentedMeansListedAndToldAllTheSame) {
  process.listener->presents = false;
  process.listen();
  process.center.deliverNotification(weekly());
  process.queue.drain();
  EXPECT_THAT(process.server.history(), IsEmpty());
  EXPECT_THAT(process.listener->events, ElementsAre("delivered Week"));
  EXPECT_THAT(process.center.deliveredNotifications(), SizeIs(1));
}

TEST_F(ScheduledNotificationCenterTest, AMissingServerOrAGoneDelegateLosesNoSchedule) {
  process.server.isPresent = false;
  process.listen();
  process.center.scheduleNotification(weekly());
  process.timer.advanceTo(start + week);
  EXPECT_THAT(process.center.deliveredNotifications(), SizeIs(1));
  process.server.isPresent = true;
  process.timer.advanceTo(start + 2 * week);
  EXPECT_THAT(process.server.banners(), SizeIs(1));

  process.center.setDelegate({});
  EXPECT_EQ(process.timer.armedDate(), std::nullopt);
  process.clock.set(start + 3 * week);
  process.center.recheck();
  EXPECT_THAT(process.server.history(), SizeIs(1));
  process.listen();
  EXPECT_THAT(process.server.history(), SizeIs(2));
}

TEST_F(ScheduledNotificationCenterTest, AStoreThatIsLockedWhenTheTimeComesDelaysTheDelivery) {
  process.listen();
  process.center.scheduleNotification(weekly());
  auto holder = SQLiteDatabase::open(file.string());
  ASSERT_FALSE(holder->execute("BEGIN EXCLUSIVE"));
  process.timer.advanceTo(start + week);
  EXPECT_THAT(process.server.history(), IsEmpty());
  ASSERT_FALSE(holder->execute("COMMIT"));
  process.timer.advanceTo(start + week + 1min);
  EXPECT_THAT(process.server.history(), SizeIs(1));
  EXPECT_EQ(process.timer.armedDate(), start + 2 * week);
}

TEST_F(ScheduledNotificationCenterTest, AnIdentifierStandsForOneNotificationOfEachList) {
  process.listen();
  process.center.scheduleNotification(weekly());
  auto again = weekly(start + 1h);
  again.title = "Again";
  process.center.scheduleNotification(again);
  process.center.scheduleNotification({.title = "One", .deliveryDate = start + 2h});
  process.center.scheduleNotification({.title = "Two", .deliveryDate = start + 2h});
  const auto scheduled = process.center.scheduledNotifications();
  ASSERT_THAT(scheduled, SizeIs(3));
  EXPECT_EQ(scheduled.at(0), again);
  process.center.removeScheduledNotification({.title = "One", .deliveryDate = start + 2h});
  EXPECT_THAT(process.center.scheduledNotifications(), SizeIs(2));
  process.center.removeScheduledNotification({.identifier = "weekly"});
  EXPECT_THAT(process.center.scheduledNotifications(), SizeIs(1));
  // Without a date, or with one that is past, it is due at once.
  process.center.scheduleNotification({.identifier = "now", .title = "Now"});
  EXPECT_THAT(process.server.history(), SizeIs(1));
}

}  // namespace
}  // namespace Varnel::Platform
