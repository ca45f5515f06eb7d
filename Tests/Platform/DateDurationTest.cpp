// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Text/DateFormatter.h>
#include <Varnel/Platform/Text/DurationFormatter.h>

#include <gtest/gtest.h>

#include <atomic>
#include <limits>
#include <memory>
#include <span>
#include <string>
#include <thread>

#include <Tests/Support/Crew.h>
#include <Tests/Support/Zones.h>
#include <Varnel/Platform/Ports/Ports.h>
#include <Varnel/Platform/Ports/TimeZones.h>

namespace Varnel::Platform {
namespace {

using namespace std::chrono;
using namespace std::chrono_literals;

constexpr const char* timestampPattern = "YYYY-MM-dd HH:mm:ss";

const TimeZones& zones = systemPorts().timeZones;

// What is finer than a microsecond is cut off, towards the past and in every age.
static_assert(Date(1us) + 1500ns == Date(2us));
static_assert(Date(1us) - 1500ns == Date(-1us));
static_assert(Date(-3us) + 999ns == Date(-3us));
static_assert(Date(sys_time<nanoseconds>(-1ns)) == Date(-1us));
static_assert(Date::max() - 1ns == Date::max() - 1us);
static_assert(Date(sys_days(32767y / December / 31)) + 1500ns > Date(sys_days(2262y / May / 1)));

TEST(DateFormatter, WritesTheYearOfTheLocalesWeek) {
  const Tests::LocalZone utc("UTC");
  const auto text = [](const char* pattern, const char* locale, sys_days day) {
    return DateFormatter(pattern, locale, zones).string(day);
  };
  EXPECT_EQ(text("YYYY-MM-dd", "en_US", 2024y / December / 31), "2025-12-31");
  EXPECT_EQ(text("yyyy-MM-dd", "en_US", 2024y / December / 31), "2024-12-31");
  EXPECT_EQ(text("YYYY-MM-dd", "de_DE", 2023y / January / 1), "2022-01-01");
  EXPECT_EQ(text("YYYY-MM-dd", "en_US", 2023y / January / 1), "2023-01-01");
  EXPECT_EQ(text("yyyy-MM-dd", "en_US", 1969y / December / 31), "1969-12-31");
  const DateFormatter formatter("dd HH", "en_US", zones);
  const Tests::LocalZone tokyo("Asia/Tokyo");
  EXPECT_EQ(text("dd HH", "en_US", 2024y / October / 27), "27 09");
  EXPECT_EQ(formatter.string(sys_days(2024y / October / 27)), "27 00") << "the zone it was made in";
}

TEST(DateFormatter, KeepsTextsOfFormattersAndSecondsApart) {
  const Tests::LocalZone utc("UTC");
  const Date date = sys_days(2024y / May / 5) + 1h;
  const DateFormatter timestamp(timestampPattern, "en_US", zones);
  const DateFormatter milliseconds("ss.SSS", "en_US", zones);
  const DateFormatter quoted("ss 'SA' ''", "en_US", zones);
  const DateFormatter longer("'a text that is much too long to be kept with its second' ss",
                             "en_US", zones);
  for (const auto part : {0us, 1000us, 999'999us, 1'000'000us, 0us, -1us}) {
    const bool isNext = part >= 1s;
    const bool isBefore = part < 0s;
    const std::string second = isNext ? "01" : isBefore ? "59" : "00";
    EXPECT_EQ(timestamp.string(date + part),
              (isBefore ? "2024-05-05 00:59:" : "2024-05-05 01:00:") + second);
    EXPECT_EQ(quoted.string(date + part), second + " SA '");
    EXPECT_TRUE(longer.string(date + part).ends_with(second));
  }
  EXPECT_EQ(milliseconds.string(date + 1'234'567us), "01.234");
  EXPECT_EQ(milliseconds.string(date + 1'235'000us), "01.235");
  EXPECT_EQ(milliseconds.string(Date(-1us)), "59.999");

  // Formatters one after the other at one address and one second.
  for (const auto& [pattern, text] : {std::pair{"HH", "01"}, {"dd", "05"}, {"yy", "24"}})
    EXPECT_EQ(DateFormatter(pattern, "en_US", zones).string(date), text);
}

TEST(DateFormatter, WritesIntoRoomThatIsLargeEnough) {
  const Tests::LocalZone utc("UTC");
  const Date date = sys_days(2024y / May / 5) + 1h;
  for (const char* pattern :
       {"HH:mm:ss", "ss.SSS", "'a text that is too long to be kept' mm:ss:HH:mm:ss"}) {
    const DateFormatter formatter(pattern, "en_US", zones);
    const std::string text = formatter.string(date + 1s);
    for (const auto second : {0s, 1s, 1s}) {
      std::string room(text.size() + 1, '~');
      EXPECT_EQ(formatter.write(date + second, std::span(room).first(text.size() - 1)), 0u);
      EXPECT_EQ(room.find_first_not_of('~'), std::string::npos);
      EXPECT_EQ(formatter.write(date + second, std::span(room).first(text.size())), text.size());
      EXPECT_EQ(room, formatter.string(date + second) + '~');
    }
  }
}

TEST(DateFormatter, SurvivesOddPatternsAndDates) {
  const Tests::LocalZone utc("UTC");
  const Date date = sys_days(2024y / May / 5) + 1h;
  EXPECT_EQ(DateFormatter("", "en_US", zones).string(date), "");
  EXPECT_EQ(DateFormatter("'open quote", "en_US", zones).string(date), "open quote");
  EXPECT_EQ(DateFormatter("yyyy N P", "en_US", zones).string(date), "2024-05-05 01:00:00");
  EXPECT_EQ(DateFormatter("yyyy", "no such locale", zones).string(date), "2024");
  EXPECT_EQ(DateFormatter("d MMMM", "de_DE", zones).string(date), "5 Mai");
  const DateFormatter formatter(timestampPattern, "en_US", zones);
  EXPECT_FALSE(formatter.string(Date::min()).empty());
  EXPECT_FALSE(formatter.string(Date::max()).empty());
}

TEST(DateFormatter, GivesEveryThreadTheTextOfItsOwnSecond) {
  const Tests::LocalZone utc("UTC");
  const DateFormatter formatter("HH:mm:ss", "en_US", zones);
  Tests::Crew(4, [&](unsigned thread) {
    for (unsigned step = 0; step < 4000; ++step) {
      const unsigned second = (thread * 7 + step / 4) % 60;
      const std::string digits = (second < 10 ? "0" : "") + std::to_string(second);
      ASSERT_EQ(formatter.string(Date(seconds(second))), "00:00:" + digits);
    }
  });
}

// As a thread that a fork leaves behind in the middle of a date holds up no child.
TEST(DateFormatter, WaitsForNoOtherThread) {
  struct SlowZones final : TimeZones, TimeZone, std::enable_shared_from_this<SlowZones> {
    mutable std::atomic<bool> isSlow = false, isMidway = false;

    std::string localIdentifier() const override { return "UTC"; }
    std::shared_ptr<const TimeZone> zone(const std::string&) const override {
      return shared_from_this();
    }
    std::optional<Date> nextChange(Date) const override { return std::nullopt; }
    Offset offsetAt(Date) const override {
      if (!isSlow.exchange(false)) return {};
      isMidway = true;
      isMidway.notify_all();
      isMidway.wait(true);
      return {};
    }
  };
  const auto slowZones = std::make_shared<SlowZones>();
  const DateFormatter formatter("HH:mm:ss", "en_US", *slowZones);
  slowZones->isSlow = true;
  const std::jthread slow([&] { EXPECT_EQ(formatter.string(Date()), "00:00:00"); });
  slowZones->isMidway.wait(false);
  EXPECT_EQ(formatter.string(Date(std::chrono::seconds(1))), "00:00:01");
  slowZones->isMidway = false;
  slowZones->isMidway.notify_all();
}

TEST(DurationFormatter, CutsOffFractionsAndLeavesOutZeroUnits) {
  struct Case {
    TimeInterval interval;
    const char* text;
  };
  constexpr TimeInterval hour = 3600;
  constexpr TimeInterval dayLength = 24 * hour;
  const Case cases[] = {
      {0, "0s"},
      {-0.999, "0s"},
      {1.999, "1s"},
      {60, "1m"},
      {3903, "1h 5m 3s"},
      {-3903.7, "-1h 5m 3s"},
      {dayLength - 1, "23h 59m 59s"},
      {dayLength, "1d"},
      {31 * dayLength, "1mo"},
      {59 * dayLength, "2mo"},
      {-31 * dayLength - 60, "-1mo 1m"},
      {364 * dayLength, "11mo 30d"},
      {(4 * 365 + 1) * dayLength, "4y"},
      {146'096 * dayLength, "399y 11mo 30d"},
      {100'000 * 365.2425 * dayLength, "100000y"},
  };
  for (const Case& test : cases)
    EXPECT_EQ(DurationFormatter().string(test.interval), test.text) << test.interval;
}

TEST(DurationFormatter, HasNoTextForWhatNoCalendarHolds) {
  using Limits = std::numeric_limits<TimeInterval>;
  for (const TimeInterval interval : {Limits::quiet_NaN(), Limits::infinity(), -Limits::infinity(),
                                      Limits::max(), Limits::lowest(), 1e13, -1e13})
    EXPECT_EQ(DurationFormatter().string(interval), std::nullopt) << interval;
  EXPECT_EQ(DurationFormatter().string(Limits::denorm_min()), "0s");
  EXPECT_TRUE(DurationFormatter().string(-9e12).has_value());
}

}  // namespace
}  // namespace Varnel::Platform
