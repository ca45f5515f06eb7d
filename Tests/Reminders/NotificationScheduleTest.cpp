// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Generic/NotificationSchedule.h>

#include <gtest/gtest.h>

#include <limits>
#include <vector>

#include <Tests/Support/Zones.h>
#include <Varnel/Platform/Text/Calendar.h>

namespace Varnel::Platform {
namespace {

using namespace std::chrono;
using namespace std::chrono_literals;

const auto zones = Tests::zonesOf2026();

Date utc(year_month_day date, minutes time = 0min) {
  return sys_days(date) + time;
}

NotificationSchedule repeating(Date date, DateComponents interval, std::string zone = "UTC") {
  return {.key = "key",
          .notification = {.deliveryDate = date, .deliveryRepeatInterval = interval},
          .timeZone = std::move(zone)};
}

// The dates at which somebody who is always awake delivers.
std::vector<Date> deliveries(NotificationSchedule schedule, int count, const Calendar& calendar) {
  std::vector<Date> dates;
  while (static_cast<int>(dates.size()) < count) {
    const auto date = nextDate(schedule, calendar);
    if (!date) break;
    EXPECT_FALSE(decide(schedule, *date - 1us, calendar).isDue);
    const ScheduleDecision decision = decide(schedule, *date, calendar);
    EXPECT_TRUE(decision.isDue);
    dates.push_back(*date);
    if (!decision.deliveryCount) break;
    schedule.deliveryCount = *decision.deliveryCount;
  }
  return dates;
}

TEST(NotificationSchedule, KeepsTheWallClockAndTheDayOfTheMonth) {
  const Calendar berlin("de_DE", "Europe/Berlin", zones);
  EXPECT_EQ(
      deliveries(repeating(utc(2026y / March / 26, 8h), {.day = 7}, "Europe/Berlin"), 3, berlin),
      (std::vector{utc(2026y / March / 26, 8h), utc(2026y / April / 2, 7h),
                   utc(2026y / April / 9, 7h)}));
  const Calendar calendar("en_US", "UTC", zones);
  EXPECT_EQ(deliveries(repeating(utc(2026y / January / 31), {.month = 1}), 4, calendar),
            (std::vector{utc(2026y / January / 31), utc(2026y / February / 28),
                         utc(2026y / March / 31), utc(2026y / April / 30)}));
}

TEST(NotificationSchedule, PeriodsThatPassedUnseenCountAsOne) {
  const Calendar calendar("en_US", "UTC", zones);
  auto schedule = repeating(utc(2026y / June / 1), {.day = 7});
  const ScheduleDecision decision = decide(schedule, utc(2026y / June / 23), calendar);
  EXPECT_TRUE(decision.isDue);
  EXPECT_EQ(decision.deliveryCount, 4);
  schedule.deliveryCount = 4;
  EXPECT_EQ(nextDate(schedule, calendar), utc(2026y / June / 29));
  // Also when it is a great many of them.
  const auto seconds = repeating(Date(), {.second = 1});
  EXPECT_EQ(
      decide(seconds, utc(2026y / June / 1), calendar).deliveryCount,
      duration_cast<std::chrono::seconds>(utc(2026y / June / 1).time_since_epoch()).count() + 1);
}

TEST(NotificationSchedule, AClockSetBackRepeatsNothingButDoesNotSilence) {
  const Calendar calendar("en_US", "UTC", zones);
  auto schedule = repeating(utc(2026y / June / 1), {.day = 7});
  schedule.deliveryCount = 2;  // Delivered on 1 and 8 June.
  // The last one is the clock of a machine that has not asked for the time yet.
  for (const Date now : {utc(2026y / June / 7), utc(2026y / June / 2), utc(2010y / January / 1)}) {
    const auto decision = decide(schedule, now, calendar);
    EXPECT_EQ(decision, (ScheduleDecision{.isDue = false, .deliveryCount = 2}));
  }
  // The clock had been a year ahead.
  schedule.deliveryCount = 53;
  const auto decision = decide(schedule, utc(2026y / June / 10), calendar);
  EXPECT_EQ(decision, (ScheduleDecision{.isDue = false, .deliveryCount = 2}));
}

TEST(NotificationSchedule, WhatCannotRepeatComesOnce) {
  const Calendar calendar("en_US", "UTC", zones);
  const Date date = utc(2026y / July / 1);
  const ScheduleDecision once{.isDue = true, .deliveryCount = std::nullopt};
  for (const DateComponents& interval :
       {DateComponents{}, DateComponents{.day = 0}, DateComponents{.day = -1},
        DateComponents{.month = 1, .day = -31}, DateComponents{.year = 1'000'000'000'000}})
    EXPECT_EQ(decide(repeating(date, interval), date, calendar), once);
  NotificationSchedule single = repeating(date, {});
  EXPECT_EQ(decide(single, date, calendar), once);
  // A number of deliveries that nothing in this program writes.
  single.deliveryCount = -5;
  EXPECT_EQ(decide(single, date, calendar).isDue, false);
  auto damaged = repeating(date, {.day = 1});
  damaged.deliveryCount = std::numeric_limits<std::int64_t>::max();
  EXPECT_FALSE(decide(damaged, date, calendar).isDue);
}

}  // namespace
}  // namespace Varnel::Platform
