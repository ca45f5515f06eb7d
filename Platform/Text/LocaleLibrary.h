// SPDX-License-Identifier: MIT
#pragma once

#include <chrono>
#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <string_view>

#include <Varnel/Platform/Values/Date.h>

namespace Varnel::Platform {

class TimeZone;

/// What people's languages and regions ask of calendars and formatters. It knows much and is large,
/// so it lies in a module of its own, which the first date or number that is written loads. Locales
/// are ICU identifiers. Any thread.
class LocaleLibrary {
 public:
  /// Writes dates by a pattern. Any thread, without a lock: a forked child writes dates too, and
  /// would wait for ever for a thread that only its parent has.
  class DatePattern {
   public:
    virtual ~DatePattern() = default;
    /// In UTF-8.
    [[nodiscard]] virtual std::string text(Date date) const = 0;
  };

  /// Counts by wall clocks, as in a zone whose offset never changes. Any thread.
  class WallCalendar {
   public:
    using Time = std::chrono::local_time<std::chrono::milliseconds>;

    virtual ~WallCalendar() = default;
    /// The time so many years, months and days later; absent beyond what the calendar can count.
    [[nodiscard]] virtual std::optional<Time> adding(std::int32_t years, std::int32_t months,
                                                     std::int32_t days, Time time) const = 0;
    [[nodiscard]] virtual int weekdayCount() const = 0;
  };

  struct Separators final {
    std::string grouping;
    std::string decimal = ".";
  };

  virtual ~LocaleLibrary() = default;

  /// Null unless a date can be written with the pattern. The zone's rules are the ones given; the
  /// identifier is for its names.
  [[nodiscard]] virtual std::unique_ptr<DatePattern> datePattern(
      std::string_view pattern, const std::string& locale, const std::string& zoneIdentifier,
      std::shared_ptr<const TimeZone> zone) const = 0;

  /// Whether the calendar that the locale names, or its region has, is the Gregorian one.
  [[nodiscard]] virtual bool isGregorian(const std::string& locale) const = 0;

  /// That calendar; null when there is none.
  [[nodiscard]] virtual std::unique_ptr<WallCalendar> wallCalendar(
      const std::string& locale) const = 0;

  [[nodiscard]] virtual Separators separators(const std::string& locale) const = 0;
};

/// The library, which lives as long as the process. Null without its module, which the system's log
/// is told once. Any thread.
[[nodiscard]] const LocaleLibrary* localeLibrary();

}  // namespace Varnel::Platform
