// SPDX-License-Identifier: MIT
#pragma once

#include <chrono>
#include <cstdint>
#include <memory>
#include <optional>
#include <string>

#include <Varnel/Platform/Api.h>
#include <Varnel/Platform/Values/Date.h>
#include <Varnel/Platform/Values/DateComponents.h>

namespace Varnel::Platform {

class TimeZones;
class UserLocale;

/// A calendar as people of one region use it, in one time zone.
///
///     const Calendar calendar("de_AT", "Europe/Vienna", timeZones);
///     calendar.adding({.month = 1}, date);     // the same wall-clock time a month later
///     calendar.adding({.month = 1}, date, 3);  // three months: 31 January gives 30 April
///
/// Years, months and days keep the wall-clock time. A time that the zone skips moves forward by the
/// length of the gap; a time that comes twice means the first. Hours and smaller units are lengths
/// of time. A month that is too short gives its last day. Immutable; any thread.
class VARNEL_API Calendar final {
 public:
  /// What clocks show, wherever they are.
  using LocalTime = std::chrono::local_time<std::chrono::microseconds>;

  /// The locale is an ICU identifier; it names a calendar ("@calendar=hebrew") or has its region's.
  /// An unknown time zone counts as UTC. The time zones outlive the calendar.
  Calendar(const std::string& localeIdentifier, const std::string& timeZoneIdentifier,
           const TimeZones& timeZones);
  /// The user's calendar as of now.
  Calendar(const UserLocale& userLocale, const TimeZones& timeZones);
  ~Calendar();
  Calendar(Calendar&&) noexcept;
  Calendar& operator=(Calendar&&) noexcept;

  [[nodiscard]] const std::string& timeZoneIdentifier() const;

  /// The date plus `count` times the components, taken in one step. Absent when the calendar or
  /// `Date` does not reach that far.
  [[nodiscard]] std::optional<Date> adding(const DateComponents& components, Date date,
                                           std::int64_t count = 1) const;

  /// The same from the moment at which this calendar's clocks show this time. Though they may skip
  /// the time itself, what is added to it comes at that time of the day.
  [[nodiscard]] std::optional<Date> adding(const DateComponents& components, LocalTime time,
                                           std::int64_t count = 1) const;

  /// What the clocks of a time zone show at `date`.
  [[nodiscard]] LocalTime wallClock(Date date, const std::string& timeZoneIdentifier) const;

  /// How many days a week has; absent when the calendar knows no weeks.
  [[nodiscard]] std::optional<int> weekdayCount() const;

 private:
  struct State;
  std::unique_ptr<State> state_;
};

}  // namespace Varnel::Platform
