// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Text/DurationFormatter.h>

#include <array>
#include <chrono>
#include <cmath>
#include <cstdint>
#include <string_view>

namespace Varnel::Platform {
namespace {

using namespace std::chrono;

struct Component {
  std::int64_t count;
  std::string_view unit;
};

using Components = std::array<Component, 6>;

// From the first day of a year the parts of the end date are the counts themselves.
constexpr sys_days start = year_month_day(year(2001), January, day(1));
constexpr days daysOfFourCenturies(146'097);

Components componentsOf(seconds length) {
  const auto wholeDays = floor<days>(length);
  // The calendar repeats after four centuries; years themselves reach no further than 32767.
  const auto cycles = wholeDays / daysOfFourCenturies;
  const year_month_day end = start + wholeDays % daysOfFourCenturies;
  const hh_mm_ss time(length - wholeDays);
  const auto years = (end.year() - year_month_day(start).year()).count();
  return {{{cycles * 400 + years, "y"},
           {static_cast<unsigned>(end.month()) - 1, "mo"},
           {static_cast<unsigned>(end.day()) - 1, "d"},
           {time.hours().count(), "h"},
           {time.minutes().count(), "m"},
           {time.seconds().count(), "s"}}};
}

}  // namespace

std::optional<std::string> DurationFormatter::string(TimeInterval interval) const {
  constexpr auto maxInterval =
      static_cast<double>(duration_cast<seconds>(Date::duration::max()).count());
  // Negated so that it also refuses what is not a number.
  if (!(std::abs(interval) <= maxInterval)) return std::nullopt;

  std::string text;
  for (const auto& [count, unit] :
       componentsOf(seconds(std::llabs(std::llround(std::trunc(interval)))))) {
    if (count == 0) continue;
    text += text.empty() ? (interval < 0 ? "-" : "") : " ";
    text.append(std::to_string(count)).append(unit);
  }
  return text.empty() ? "0s" : text;
}

}  // namespace Varnel::Platform
