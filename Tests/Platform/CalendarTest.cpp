// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Text/Calendar.h>

#include <gtest/gtest.h>

#include <limits>

#include <Tests/Support/Zones.h>

namespace Varnel::Platform {
namespace {

using namespace std::chrono;
using namespace std::chrono_literals;

const auto zones = Tests::zonesOf2026();
constexpr auto month = DateComponents{.month = 1};

Date utc(year_month_day date, minutes time = 0min) {
  return sys_days(date) + time;
}

TEST(Calendar, EachRepetitionIsCountedFromTheOriginalDate) {
  const Calendar calendar("en_US", "UTC", zones);
  const Date last = utc(2026y / January / 31, 9h + 5min) + 123456us;
  const auto nth = [&](int n) { return *calendar.adding(month, last, n) - 123456us; };
  EXPECT_EQ(nth(0), utc(2026y / January / 31, 9h + 5min));
  EXPECT_EQ(nth(1), utc(2026y / February / 28, 9h + 5min));
  EXPECT_EQ(nth(2), utc(2026y / March / 31, 9h + 5min));
  EXPECT_EQ(nth(25), utc(2028y / February / 29, 9h + 5min));
  EXPECT_EQ(calendar.adding({.year = 1}, utc(2024y / February / 29)), utc(2025y / February / 28));
  EXPECT_EQ(calendar.adding(month, utc(1969y / March / 1) - 1us), utc(1969y / March / 29) - 1us);
  EXPECT_EQ(calendar.adding({.day = 1, .hour = 2, .minute = 3, .second = 4}, last, 3),
            last + days(3) + 6h + 9min + 12s);
  // 02:30 comes twice on 25 October, and the first counts; hours may well lead to the second.
  const Calendar berlin("de_DE", "Europe/Berlin", zones);
  const Date firstOfTwo = utc(2026y / October / 25, 30min);
  EXPECT_EQ(berlin.adding({.day = 1}, firstOfTwo + days(1) + 1h, -1), firstOfTwo);
  EXPECT_EQ(berlin.adding({.hour = 1}, firstOfTwo), firstOfTwo + 1h);
  EXPECT_EQ(berlin.adding({.day = 1}, firstOfTwo - days(1)), firstOfTwo);
  EXPECT_EQ(berlin.adding({.day = 1}, firstOfTwo - days(1) + 30min), firstOfTwo + 90min);
  // What the clocks skip on 29 March is as much later; 03:00 is their first time again.
  const Date skipped = utc(2026y / March / 29, 1h + 30min);
  EXPECT_EQ(berlin.adding({.day = 1}, skipped - days(1)), skipped);
  EXPECT_EQ(berlin.adding({.day = 1}, skipped - days(1) + 30min), skipped - 30min);
  EXPECT_EQ(berlin.adding({.day = 2}, skipped - days(1)), skipped + days(1) - 1h);
  EXPECT_EQ(berlin.adding(month, utc(2026y / March / 1, 1h + 30min)),
            utc(2026y / April / 1, 30min));
}

TEST(Calendar, CountsInTheCalendarOfTheLocale) {
  // In the Hebrew year 5784 Adar comes twice; a year later there is but one.
  const Calendar hebrew("he_IL@calendar=hebrew", "UTC", zones);
  EXPECT_EQ(hebrew.adding({.year = 1}, utc(2024y / October / 3)), utc(2025y / September / 23));
  // The first month of the Persian year has 31 days.
  EXPECT_EQ(Calendar("fa_IR", "UTC", zones).adding(month, utc(2026y / March / 21)),
            utc(2026y / April / 21));
  EXPECT_EQ(Calendar("th_TH", "UTC", zones).adding({.year = 1000}, utc(2026y / March / 21)),
            utc(3026y / March / 21));
  for (const char* locale : {"en_US", "he_IL@calendar=hebrew", "fa_IR", "", "nonsense"})
    EXPECT_EQ(Calendar(locale, "UTC", zones).weekdayCount(), 7) << locale;
}

TEST(Calendar, CountsInEveryYearOfTheGregorianOne) {
  // With a locale that names it, where the region has another, and with one that knows none.
  for (const char* locale : {"en_US", "th_TH@calendar=gregorian", "", "nonsense"}) {
    const Calendar calendar(locale, "UTC", zones);
    const auto later = [&](year_month_day date, int months) {
      return year_month_day(floor<days>(*calendar.adding(month, utc(date, 9h), months)));
    };
    EXPECT_EQ(later(2000y / January / 31, -11), 1999y / February / 28) << locale;
    EXPECT_EQ(later(2000y / January / 31, 1), 2000y / February / 29);
    EXPECT_EQ(later(2399y / December / 31, 2), 2400y / February / 29);
    EXPECT_EQ(later(1y / January / 31, -1), 0y / December / 31);
    EXPECT_EQ(later(0y / January / 31, -11), -1y / February / 28);
    EXPECT_EQ(later(-400y / February / 29, -1), -400y / January / 29);
    EXPECT_EQ(later(-1y / December / 31, 12 * 2401 + 2), 2401y / February / 28);
    EXPECT_EQ(calendar.adding({.day = -800'000}, utc(2026y / March / 1)),
              utc(2026y / March / 1) - days(800'000));
    // Years come before months, and days last.
    EXPECT_EQ(calendar.adding({.year = 1, .month = -1, .day = 1}, utc(2024y / February / 29)),
              utc(2025y / January / 29));
  }
}

TEST(Calendar, MovesAWallClockTimeIntoAnotherZone) {
  const Calendar newYork("en_US", "America/New_York", zones);
  const auto moved = [&](Date date, const char* zone, const DateComponents& components = {}) {
    return newYork.adding(components, newYork.wallClock(date, zone));
  };
  const Date summer = utc(2026y / July / 1, 7h);
  EXPECT_EQ(moved(summer + 123456us, "Europe/Berlin"), summer + 6h + 123456us);
  EXPECT_EQ(moved(summer, "No/Such_Zone"), summer + 4h);
  // New York skips this time, and no other day's.
  const Date skipped = utc(2026y / March / 8, 2h + 30min);
  EXPECT_EQ(moved(skipped, "UTC"), utc(2026y / March / 8, 7h + 30min));
  EXPECT_EQ(moved(skipped, "UTC", {.day = 1}), utc(2026y / March / 9, 6h + 30min));
}

TEST(Calendar, AnswersNothingBeyondWhatItCanCount) {
  const Calendar calendar("en_US", "Europe/Berlin", zones);
  const Date now = utc(2026y / March / 1);
  constexpr auto huge = std::numeric_limits<std::int64_t>::max();
  EXPECT_EQ(calendar.adding({.year = huge}, now), std::nullopt);
  EXPECT_EQ(calendar.adding({.day = 2}, now, huge), std::nullopt);
  EXPECT_EQ(calendar.adding({.hour = huge}, now), std::nullopt);
  EXPECT_EQ(calendar.adding({.year = 2'000'000'000}, now), std::nullopt);
  const auto late = calendar.adding({.year = 280'000}, now);
  ASSERT_TRUE(late);
  EXPECT_EQ(calendar.adding({.hour = 2'000'000'000}, *late), std::nullopt);
  EXPECT_EQ(calendar.adding({.year = 1}, Date::max()), std::nullopt);
  for (const Date edge : {Date::min(), Date::max()}) {
    EXPECT_EQ(calendar.adding({}, calendar.wallClock(edge, "UTC")), std::nullopt);
    EXPECT_EQ(calendar.adding({}, edge), std::nullopt);
  }
  EXPECT_EQ(calendar.adding({}, now), now);
}

}  // namespace
}  // namespace Varnel::Platform
