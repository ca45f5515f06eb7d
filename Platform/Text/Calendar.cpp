// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Text/Calendar.h>

#include <limits>

#include <Varnel/Platform/Ports/TimeZones.h>
#include <Varnel/Platform/Ports/UserLocale.h>
#include <Varnel/Platform/Text/GregorianCalendar.h>
#include <Varnel/Platform/Text/LocaleLibrary.h>

namespace Varnel::Platform {
namespace {

using std::chrono::milliseconds;
using LocalTime = Calendar::LocalTime;

// How far a calculation may lead; `Date` reaches 292,000 years.
constexpr milliseconds maxMilliseconds(9'000'000'000'000'000);

template <typename Time>
bool isWithinReach(Time time) {
  return time.time_since_epoch() <= maxMilliseconds && time.time_since_epoch() >= -maxMilliseconds;
}

LocalTime wallClockAt(Date date, const TimeZone& zone) {
  return LocalTime(date.time_since_epoch() + zone.offsetAt(date).fromUTC);
}

// For a time that comes twice, the first one. For a time that is skipped, the offset before the
// change applies and moves it forward.
Date resolved(LocalTime local, const TimeZone& zone) {
  const Date utc(local.time_since_epoch());
  // No offset is as long as a day.
  Date begin = utc - std::chrono::days(1);
  auto offset = zone.offsetAt(begin).fromUTC;
  for (auto change = zone.nextChange(begin); change && utc - offset >= *change;
       change = zone.nextChange(begin)) {
    const auto changed = zone.offsetAt(*change).fromUTC;
    if (utc - changed < *change) break;
    offset = changed;
    begin = *change;
  }
  return utc - offset;
}

bool hasDays(const DateComponents& components) {
  return components.year || components.month || components.day;
}

// A product that does not overflow and that the calendar can count with.
std::optional<std::int32_t> product(std::int64_t amount, std::int64_t count) {
  std::int64_t result = 0;
  if (__builtin_mul_overflow(amount, count, &result)) return std::nullopt;
  if (result > std::numeric_limits<std::int32_t>::max() ||
      result < std::numeric_limits<std::int32_t>::min())
    return std::nullopt;
  return static_cast<std::int32_t>(result);
}

}  // namespace

struct Calendar::State {
  const TimeZones& zones;
  std::string zoneIdentifier;
  std::shared_ptr<const TimeZone> zone = zones.zone(zoneIdentifier);
  std::unique_ptr<const LocaleLibrary::WallCalendar> calendar = nullptr;

  std::optional<LocalTime> addingDays(const DateComponents& components, LocalTime local,
                                      std::int64_t count) const {
    const auto years = product(components.year.value_or(0), count);
    const auto months = product(components.month.value_or(0), count);
    const auto days = product(components.day.value_or(0), count);
    if (!calendar || !years || !months || !days) return std::nullopt;
    const auto whole = std::chrono::floor<milliseconds>(local);
    const auto sum = calendar->adding(*years, *months, *days, whole);
    return sum && isWithinReach(*sum) ? std::optional(*sum + (local - whole)) : std::nullopt;
  }

  static std::optional<Date> addingTime(const DateComponents& components, Date date,
                                        std::int64_t count) {
    // Milliseconds count further than microseconds.
    auto time = std::chrono::floor<milliseconds>(date);
    const auto rest = date - time;
    const auto add = [&](const std::optional<std::int64_t>& amount, auto unit) {
      const auto total = product(amount.value_or(0), count);
      if (total) time += *total * milliseconds(unit);
      return total.has_value();
    };
    if (!add(components.hour, std::chrono::hours(1)) ||
        !add(components.minute, std::chrono::minutes(1)) ||
        !add(components.second, std::chrono::seconds(1)) || !isWithinReach(time))
      return std::nullopt;
    return time + rest;
  }
};

Calendar::Calendar(const std::string& localeIdentifier, const std::string& timeZoneIdentifier,
                   const TimeZones& timeZones)
    : state_(new State{.zones = timeZones, .zoneIdentifier = timeZoneIdentifier}) {
  const LocaleLibrary* library = localeLibrary();
  if (!library) return;
  if (library->isGregorian(localeIdentifier))
    state_->calendar = std::make_unique<GregorianCalendar>();
  else
    state_->calendar = library->wallCalendar(localeIdentifier);
}

Calendar::Calendar(const UserLocale& userLocale, const TimeZones& timeZones)
    : Calendar(userLocale.identifier(), timeZones.localIdentifier(), timeZones) {}

Calendar::~Calendar() = default;
Calendar::Calendar(Calendar&&) noexcept = default;
Calendar& Calendar::operator=(Calendar&&) noexcept = default;

const std::string& Calendar::timeZoneIdentifier() const {
  return state_->zoneIdentifier;
}

std::optional<Date> Calendar::adding(const DateComponents& components, Date date,
                                     std::int64_t count) const {
  if (!isWithinReach(date)) return std::nullopt;
  if (hasDays(components)) return adding(components, wallClockAt(date, *state_->zone), count);
  return State::addingTime(components, date, count);
}

std::optional<Date> Calendar::adding(const DateComponents& components, LocalTime time,
                                     std::int64_t count) const {
  if (!isWithinReach(time)) return std::nullopt;
  const auto sum =
      hasDays(components) ? state_->addingDays(components, time, count) : std::optional(time);
  if (!sum) return std::nullopt;
  return State::addingTime(components, resolved(*sum, *state_->zone), count);
}

LocalTime Calendar::wallClock(Date date, const std::string& timeZoneIdentifier) const {
  return isWithinReach(date) ? wallClockAt(date, *state_->zones.zone(timeZoneIdentifier))
                             : LocalTime(date.time_since_epoch());
}

std::optional<int> Calendar::weekdayCount() const {
  const int count = state_->calendar ? state_->calendar->weekdayCount() : 0;
  return count > 0 ? std::optional(count) : std::nullopt;
}

}  // namespace Varnel::Platform
