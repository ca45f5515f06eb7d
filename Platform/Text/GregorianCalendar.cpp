// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Text/GregorianCalendar.h>

#include <algorithm>

namespace Varnel::Platform {
namespace {

using std::chrono::local_days;
using std::chrono::year_month_day;
using Days = std::chrono::duration<std::int64_t, std::chrono::days::period>;

// After 400 years the calendar repeats itself, to the day of the week. So every date is counted in
// the years from 0 to 399, which are within what the library counts.
constexpr std::int64_t monthsOfYear = 12;
constexpr std::int64_t monthsOfCycle = 400 * monthsOfYear;
constexpr Days cycle(146'097);

// What milliseconds reach.
constexpr Days maxDays(100'000'000'000);

constexpr std::int64_t floored(std::int64_t number, std::int64_t divisor) {
  return number / divisor - (number % divisor < 0 ? 1 : 0);
}

struct DayOfMonth {
  std::int64_t month;  ///< Since January of the year 0.
  std::chrono::day day;
};

std::chrono::year_month withinCycle(std::int64_t month) {
  const auto rest = static_cast<int>(month - floored(month, monthsOfCycle) * monthsOfCycle);
  return std::chrono::year(rest / 12) / (rest % 12 + 1);
}

DayOfMonth dateOf(Days sinceEpoch) {
  const std::int64_t cycles = floored(sinceEpoch.count(), cycle.count());
  const auto rest = std::chrono::duration_cast<std::chrono::days>(sinceEpoch - cycles * cycle);
  const year_month_day date{local_days(rest)};
  const std::int64_t year = int{date.year()};
  const std::int64_t month = unsigned{date.month()};
  return {cycles * monthsOfCycle + year * monthsOfYear + month - 1, date.day()};
}

Days daysOf(const DayOfMonth& date) {
  const local_days day(withinCycle(date.month) / date.day);
  return floored(date.month, monthsOfCycle) * cycle + Days(day.time_since_epoch());
}

// The same day so many months later, or the last one of a shorter month.
DayOfMonth later(const DayOfMonth& date, std::int64_t months) {
  const std::int64_t month = date.month + months;
  return {month, std::min(date.day, (withinCycle(month) / std::chrono::last).day())};
}

}  // namespace

std::optional<GregorianCalendar::Time> GregorianCalendar::adding(std::int32_t years,
                                                                 std::int32_t months,
                                                                 std::int32_t days,
                                                                 Time time) const {
  const auto day = std::chrono::floor<Days>(time);
  const DayOfMonth date =
      later(later(dateOf(day.time_since_epoch()), years * monthsOfYear), months);
  const Days sum = daysOf(date) + Days(days);
  if (std::chrono::abs(sum) > maxDays) return std::nullopt;
  return Time(sum) + (time - day);
}

}  // namespace Varnel::Platform
