// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Generic/NotificationSchedule.h>

#include <limits>

#include <Varnel/Platform/Text/Calendar.h>

namespace Varnel::Platform {
namespace {

// Processes in different time zones see one date at most this far apart.
constexpr std::chrono::days sameMoment(2);

// Before this was written nobody scheduled anything with it.
constexpr Date firstSchedules = std::chrono::sys_days(std::chrono::year(2026) / 1 / 1);

// The dates of one schedule by number, from the original one, 0. They ascend; a date beyond the
// calendar comes after all others.
class Dates final {
 public:
  Dates(const NotificationSchedule& schedule, const Calendar& calendar)
      : calendar_(calendar),
        interval_(schedule.notification.deliveryRepeatInterval),
        origin_(schedule.notification.deliveryDate.value_or(Date())) {
    if (schedule.timeZone != calendar.timeZoneIdentifier())
      local_ = calendar.wallClock(origin_, schedule.timeZone);
    first_ = after(DateComponents(), 1).value_or(origin_);
    const auto second = interval_ ? after(*interval_, 1) : std::nullopt;
    repeats_ = second && *second > first_;
    areUnknown_ = interval_ && !second && !calendar.weekdayCount();
  }

  bool repeats() const { return repeats_; }

  // Whether there may be more than the first one, which the calendar cannot tell: without its
  // library it counts no days.
  bool areUnknown() const { return areUnknown_; }

  std::optional<Date> at(std::int64_t number) const {
    if (number == 0) return first_;
    return repeats_ ? after(*interval_, number) : std::nullopt;
  }

  bool isAfter(std::int64_t number, Date now) const {
    const auto date = at(number);
    return !date || *date > now;
  }

  // The first number from `start` whose date is after `now`.
  std::int64_t firstAfter(Date now, std::int64_t start) const {
    constexpr auto maxNumber = std::numeric_limits<std::int64_t>::max() / 4;
    std::int64_t step = 1;
    while (start + step < maxNumber && !isAfter(start + step, now)) step *= 2;
    std::int64_t low = start;
    for (std::int64_t high = start + step; low < high;) {
      const std::int64_t middle = low + (high - low) / 2;
      if (isAfter(middle, now))
        high = middle;
      else
        low = middle + 1;
    }
    return low;
  }

 private:
  std::optional<Date> after(const DateComponents& interval, std::int64_t count) const {
    return local_ ? calendar_.adding(interval, *local_, count)
                  : calendar_.adding(interval, origin_, count);
  }

  const Calendar& calendar_;
  const std::optional<DateComponents> interval_;
  const Date origin_;
  std::optional<Calendar::LocalTime> local_;  // Of the origin, where that is in another zone.
  Date first_;
  bool repeats_ = false;
  bool areUnknown_ = false;
};

}  // namespace

std::optional<Date> nextDate(const NotificationSchedule& schedule, const Calendar& calendar) {
  return Dates(schedule, calendar).at(schedule.deliveryCount);
}

ScheduleDecision decide(const NotificationSchedule& schedule, Date now, const Calendar& calendar) {
  const Dates dates(schedule, calendar);
  const std::int64_t count = schedule.deliveryCount;
  if (!dates.isAfter(count, now)) {
    if (dates.areUnknown()) return {.isDue = true, .deliveryCount = count + 1};
    if (!dates.repeats()) return {.isDue = true, .deliveryCount = std::nullopt};
    const std::int64_t next = dates.firstAfter(now, count + 1);
    return {.isDue = true, .deliveryCount = dates.at(next) ? std::optional(next) : std::nullopt};
  }
  const auto beforeLast = count > 0 && dates.repeats() ? dates.at(count - 2) : std::nullopt;
  if (beforeLast && *beforeLast - sameMoment > now && now >= firstSchedules)
    return {.deliveryCount = dates.firstAfter(now, 0)};
  return {.deliveryCount = count};
}

}  // namespace Varnel::Platform
