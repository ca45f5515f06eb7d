// SPDX-License-Identifier: MIT
#include <Varnel/Reminders/SchedulerService.h>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <Tests/Support/Zones.h>
#include <Varnel/Context/ProcessFacts.h>
#include <Varnel/Identification/Analytics/CustomDimensionsHolder.h>
#include <Varnel/Modules/VarnelModule.h>
#include <Varnel/Platform/POSIX/Adapters.h>
#include <Varnel/Platform/Ports/PrivateFiles.h>
#include <Varnel/Platform/Testing/FakeApplication.h>
#include <Varnel/Platform/Testing/FakeMainQueue.h>
#include <Varnel/Platform/Testing/FakeProcessInfo.h>
#include <Varnel/Platform/Testing/FakeUser.h>
#include <Varnel/Platform/Testing/FakeUserNotificationCenter.h>
#include <Varnel/Platform/Testing/FakeWorkspace.h>
#include <Varnel/Platform/Testing/SimulatedClock.h>
#include <Varnel/Reminders/NextDayCleanupReminderInfo.h>
#include <Varnel/Reminders/UserNotificationRouter.h>
#include <Varnel/Tallyhouse/AnalyticsTracker.h>
#include <Varnel/Tallyhouse/Testing/MemoryTransport.h>

namespace Varnel {
namespace {

using namespace std::chrono;
using namespace std::chrono_literals;
using Platform::UserNotification;
using Platform::Testing::Fault;
using ::testing::HasSubstr;
using ::testing::IsEmpty;
using ::testing::SizeIs;

constexpr Platform::Date now = sys_days(2026y / March / 20) + 9h + 41min;

class SchedulerServiceTest : public ::testing::Test {
 protected:
  SchedulerServiceTest() { module->setBundle(Bundle(VARNEL_TEST_RESOURCES, {"en"})); }

  [[nodiscard]] UserNotification onlyScheduled() {
    const auto scheduled = *center.scheduledNotifications();
    EXPECT_THAT(scheduled, SizeIs(1));
    return scheduled.empty() ? UserNotification() : scheduled.front();
  }

  Platform::Testing::SimulatedClock clock{now};
  Platform::Testing::FakeUserLocale locale;
  Platform::Testing::FakeTimeZones zones = Tests::zonesOf2026();
  Platform::Testing::FakeMainQueue queue;
  Platform::Testing::FakeApplication application;
  Platform::Testing::FakeUserNotificationCenter center;
  Platform::Testing::FakeProcessInfo processInfo;
  Platform::Testing::FakeUserAccount account;
  Platform::Testing::FakeWorkspace workspace;
  const std::unique_ptr<Platform::PrivateFiles> privateFiles = Platform::POSIX::makePrivateFiles();
  const ProcessFacts facts{{clock, *privateFiles, processInfo, account, workspace},
                           {.isSiteVersion = true, .appName = "Another 3"}};
  const std::shared_ptr<VarnelModule> module = std::make_shared<VarnelModule>();
  const std::shared_ptr<Tallyhouse::Testing::MemoryTransport> sent =
      std::make_shared<Tallyhouse::Testing::MemoryTransport>();
  UserNotificationRouter router{{center, application, queue}};
  SchedulerService service{
      {clock, locale, zones, queue, facts, module},
      std::make_shared<Tallyhouse::AnalyticsTracker>(sent, Tallyhouse::Consent::granted),
      router};
};

TEST_F(SchedulerServiceTest, StartsWithNeverAndTouchesNothing) {
  EXPECT_FALSE(
      center.scheduleNotification({.identifier = "old", .deliveryRepeatInterval = {{.day = 7}}}));
  EXPECT_EQ(service.schedulePeriod(), SchedulePeriodOption::never);
  EXPECT_THAT(*center.scheduledNotifications(), SizeIs(1));
  service.scheduleCleanReminder();
  EXPECT_THAT(*center.scheduledNotifications(), IsEmpty());
}

TEST_F(SchedulerServiceTest, ASettingPlansTheReminderAFullPeriodAhead) {
  service.setSchedulePeriod(SchedulePeriodOption::monthly);
  EXPECT_EQ(
      onlyScheduled(),
      (UserNotification{.identifier = "SchedulerNotification",
                        .title = "Time to clean up",
                        .informativeText = "Let Another 3 look for duplicate files on your disks.",
                        .actionButtonTitle = "Scan",
                        .otherButtonTitle = "Later",
                        .deliveryDate = sys_days(2026y / April / 20) + 9h + 41min,
                        .deliveryRepeatInterval = {{.month = 1}}}));
  // The same setting again plans again.
  clock.advance(days(1));
  service.setSchedulePeriod(SchedulePeriodOption::monthly);
  EXPECT_EQ(onlyScheduled().deliveryDate, sys_days(2026y / April / 21) + 9h + 41min);
  service.setSchedulePeriod(SchedulePeriodOption::never);
  EXPECT_THAT(*center.scheduledNotifications(), IsEmpty());
}

TEST_F(SchedulerServiceTest, NamesSizesFromTwoBillionBytesOn) {
  service.setSchedulePeriod(SchedulePeriodOption::onceInTwoWeeks);
  for (const std::int64_t size : {std::int64_t{-1}, std::int64_t{1'999'999'999}}) {
    service.scheduleCleanReminder(size);
    EXPECT_EQ(onlyScheduled().title, "Time to clean up");
  }
  service.scheduleCleanReminder(2'500'000'000);
  EXPECT_EQ(onlyScheduled().title, "Another 3 has more to clean up");
  EXPECT_EQ(onlyScheduled().informativeText, "Duplicate files still take up 2.5 GB of your disks.");
  service.scheduleCleanReminder(2'000'000'000);
  EXPECT_THAT(*onlyScheduled().informativeText, HasSubstr(" 2 GB "));
}

TEST_F(SchedulerServiceTest, AnotherPeriodKeepsTheTextsOfTheFirstRepeatingNotification) {
  service.setSchedulePeriod(SchedulePeriodOption::annually);
  service.scheduleCleanReminder(2'500'000'000);
  const UserNotification before = onlyScheduled();
  service.setSchedulePeriod(SchedulePeriodOption::weekly);
  auto expected = before;
  expected.deliveryDate = now + days(7);
  expected.deliveryRepeatInterval = {{.day = 7}};
  EXPECT_EQ(onlyScheduled(), expected);

  // Texts that are missing are made up for; the default name is replaced wherever it stands.
  service.setSchedulePeriod(SchedulePeriodOption::never);
  EXPECT_FALSE(center.scheduleNotification(
      {.title = "Orvane 2, Orvane 2!", .deliveryRepeatInterval = {{.day = 1}}}));
  service.setSchedulePeriod(SchedulePeriodOption::weekly);
  EXPECT_EQ(onlyScheduled().title, "Another 3, Another 3!");
  EXPECT_EQ(onlyScheduled().informativeText,
            "Let Another 3 look for duplicate files on your disks.");
}

TEST_F(SchedulerServiceTest, SweepsEveryRepeatingNotificationAndNoOther) {
  const UserNotification once{.identifier = "once"};
  const UserNotification host{.identifier = "host", .deliveryRepeatInterval = {{.hour = 1}}};
  for (const auto& each : {once, host}) {
    EXPECT_FALSE(center.scheduleNotification(each));
    EXPECT_FALSE(center.deliverNotification(each));
  }
  service.setSchedulePeriod(SchedulePeriodOption::weekly);
  ASSERT_THAT(*center.deliveredNotifications(), SizeIs(1));
  EXPECT_EQ(center.deliveredNotifications()->front().identifier, "once");
  EXPECT_THAT(*center.scheduledNotifications(), SizeIs(2));
}

// Whichever call fails: the old reminder or the new one, with the texts and the date that were
// asked for first.
TEST_F(SchedulerServiceTest, AFailedPlanChangesNothingAndIsMadeLater) {
  service.setSchedulePeriod(SchedulePeriodOption::annually);
  const UserNotification old = onlyScheduled();
  EXPECT_FALSE(center.deliverNotification(old));
  // Two lists are read, two removals and the schedule made.
  for (std::size_t call = 1; call <= 5; ++call) {
    center.faults->plan(Fault::fails, center.faults->calls() + call);
    service.scheduleCleanReminder(2'500'000'000);
    center.faults->mend();
    ASSERT_TRUE(service.failure()) << call;
    EXPECT_EQ(service.failure()->localizedDescription(), "No space left on device");
    EXPECT_EQ(onlyScheduled(), old);
    EXPECT_THAT(*center.deliveredNotifications(), SizeIs(1));
  }
  center.retry();
  EXPECT_FALSE(service.failure());
  EXPECT_THAT(*onlyScheduled().informativeText, HasSubstr(" 2.5 GB "));
  EXPECT_THAT(*center.deliveredNotifications(), IsEmpty());
  EXPECT_EQ(onlyScheduled().deliveryRepeatInterval, (Platform::DateComponents{.year = 1}));

  center.faults->plan(Fault::fails, 1);
  service.scheduleCleanReminder(3'500'000'000);
  service.setSchedulePeriod(SchedulePeriodOption::weekly);  // Takes its place, not its texts.
  clock.advance(1h);
  center.retry();
  EXPECT_EQ(center.retryCount(), 1u);
  center.faults->mend();
  center.retry();
  EXPECT_FALSE(service.failure());
  EXPECT_THAT(*onlyScheduled().informativeText, HasSubstr(" 3.5 GB "));
  EXPECT_EQ(onlyScheduled().deliveryDate, now + days(7));
  const UserNotification made = onlyScheduled();
  center.retry();
  EXPECT_EQ(onlyScheduled(), made);
}

TEST_F(SchedulerServiceTest, AClickThatCannotBeNotedIsNotedLaterAndRetriesEndWithTheService) {
  service.setSchedulePeriod(SchedulePeriodOption::weekly);
  EXPECT_FALSE(center.deliverNotification(onlyScheduled()));
  center.faults->plan(Fault::fails, 1);
  center.activate(center.presented.front());
  queue.drain();
  center.faults->mend();
  center.retry();
  EXPECT_THAT(*center.deliveredNotifications(), IsEmpty());
  {
    SchedulerService brief({clock, locale, zones, queue, facts, module},
                           std::make_shared<Tallyhouse::AnalyticsTracker>(), router);
    center.faults->plan(Fault::fails, 1);
    brief.setSchedulePeriod(SchedulePeriodOption::never);
    center.faults->mend();
  }
  center.retry();
  EXPECT_THAT(*center.scheduledNotifications(), SizeIs(1));
}

TEST_F(SchedulerServiceTest, AClickIsReportedOnceAndTakesTheBannerAwayNotTheRepetition) {
  CustomDimensionsHolder::setClientIdentifier("client");
  CustomDimensionsHolder::setDownloadSourceURL(std::nullopt);
  service.setSchedulePeriod(SchedulePeriodOption::weekly);
  const UserNotification reminder = onlyScheduled();
  EXPECT_FALSE(center.deliverNotification(reminder));
  queue.drain();
  EXPECT_THAT(sent->events(), IsEmpty());

  center.activate(reminder);
  queue.drain();
  ASSERT_THAT(sent->events(), SizeIs(1));
  const auto event = sent->events().front();
  EXPECT_EQ(event.category, "Scheduler");
  EXPECT_EQ(event.action, "Notification Clicked");
  EXPECT_EQ(event.label, "09:41");
  EXPECT_EQ(event.value, std::nullopt);
  EXPECT_THAT(*center.deliveredNotifications(), IsEmpty());
  EXPECT_EQ(onlyScheduled(), reminder);

  router.handleLaunch(reminder);
  queue.drain();
  EXPECT_THAT(sent->events(), SizeIs(2));
}

TEST_F(SchedulerServiceTest, TheNextDaysReminderComesADayLaterAtTheSameTime) {
  zones.local = "Europe/Berlin";
  clock.set(sys_days(2026y / March / 28) + 17h + 30min);  // 18:30 before the clocks change
  const NextDayCleanupReminderInfo info(1, 3'200'000'000);
  EXPECT_EQ(info, NextDayCleanupReminderInfo(1, 3'200'000'000));
  EXPECT_NE(info, NextDayCleanupReminderInfo(2, 3'200'000'000));
  EXPECT_NE(info, NextDayCleanupReminderInfo(1, 3));
  EXPECT_EQ(info.makeUserNotification({clock, locale, zones, *module}),
            (UserNotification{.identifier = "com.quennel.Orvane2.daily-cleanup-reminder",
                              .title = "Your duplicates are waiting",
                              .informativeText = "You can still free up to 3.2 GB of disk space.",
                              .actionButtonTitle = "Clean Up",
                              .otherButtonTitle = "Not Now",
                              .deliveryDate = sys_days(2026y / March / 29) + 16h + 30min}));
  clock.set(Platform::Date::max());
  EXPECT_EQ(info.makeUserNotification({clock, locale, zones, *module}).deliveryDate, std::nullopt);
}

}  // namespace
}  // namespace Varnel
