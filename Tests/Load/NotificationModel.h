// SPDX-License-Identifier: MIT
#pragma once

#include <algorithm>
#include <chrono>
#include <cstdint>
#include <map>
#include <optional>
#include <string>
#include <utility>
#include <vector>

#include <Varnel/Platform/Testing/FakeTimeZones.h>
#include <Varnel/Platform/Values/Date.h>
#include <Varnel/Platform/Values/DateComponents.h>

namespace Varnel::Tests {

using LocalTime = std::chrono::local_time<std::chrono::microseconds>;

/// What the clocks on the user's wall show, and the months of one calendar.
struct Almanac {
  const Platform::Testing::FakeTimeZones& zones;
  bool isCoptic = false;  ///< Otherwise Gregorian.

  [[nodiscard]] LocalTime localOf(Platform::Date date) const {
    std::chrono::seconds offset{};
    for (const auto& change : zones.changes.at(zones.local))
      if (change.begin <= date) offset = change.offset.fromUTC;
    return LocalTime(date.time_since_epoch() + offset);
  }

  /// The first time that the clocks show it. A time that they skip comes later by as much.
  [[nodiscard]] Platform::Date dateOf(LocalTime local) const {
    std::optional<Platform::Date> first, latest;
    for (const auto& change : zones.changes.at(zones.local)) {
      const Platform::Date date(local.time_since_epoch() - change.offset.fromUTC);
      latest = std::max(latest.value_or(date), date);
      if (localOf(date) == local) first = std::min(first.value_or(date), date);
    }
    return first.value_or(*latest);
  }

  [[nodiscard]] LocalTime adding(std::int64_t months, std::int64_t days, LocalTime local) const {
    const auto midnight = std::chrono::floor<std::chrono::days>(local);
    const auto day = isCoptic ? addingCoptic(months, midnight) : addingGregorian(months, midnight);
    return day + std::chrono::days(days) + (local - midnight);
  }

 private:
  using LocalDay = std::chrono::local_days;

  static LocalDay addingGregorian(std::int64_t months, LocalDay day) {
    using namespace std::chrono;
    const year_month_day date(day);
    const auto month = year_month(date.year(), date.month()) + std::chrono::months(months);
    return LocalDay(month / std::min(date.day(), (month / last).day()));
  }

  // Twelve months of thirty days and one of five; it has six in each fourth year.
  static LocalDay addingCoptic(std::int64_t months, LocalDay day) {
    constexpr std::int64_t epoch = -615558;
    const auto yearBegin = [](std::int64_t year) { return epoch + 365 * (year - 1) + year / 4; };
    const std::int64_t number = day.time_since_epoch().count();
    std::int64_t year = (number - epoch) / 366;
    while (yearBegin(year + 1) <= number) ++year;
    const std::int64_t ofYear = number - yearBegin(year);
    const std::int64_t month = 13 * year + ofYear / 30 + months;
    year = month / 13;
    const std::int64_t length = month % 13 < 12 ? 30 : year % 4 == 3 ? 6 : 5;
    const std::int64_t sum = yearBegin(year) + month % 13 * 30 + std::min(ofYear % 30, length - 1);
    return LocalDay(std::chrono::days(sum));
  }
};

/// A product's notifications in a form that is plainly right: what is planned, and what must have
/// been delivered by now.
struct NotificationModel {
  struct Plan {
    std::string title;
    LocalTime origin{};
    std::int64_t months = 0, days = 0, hours = 0;  ///< The period; all 0 where it comes once.
    std::int64_t next = 0;                         ///< The first date that was not reached, and
    Platform::Date date{};                         ///< when it comes.

    [[nodiscard]] bool repeats() const { return months + days + hours > 0; }
    [[nodiscard]] Platform::Date at(std::int64_t number, const Almanac& almanac) const {
      return almanac.dateOf(almanac.adding(number * months, number * days, origin)) +
             std::chrono::hours(number * hours);
    }
    /// Goes on with the first date from that number on that is still ahead.
    void skipTo(Platform::Date now, std::int64_t number, const Almanac& almanac) {
      next = number;
      for (date = at(next, almanac); date <= now; date = at(next, almanac)) ++next;
    }
  };

  /// The last delivery of one identifier.
  struct Delivery {
    std::string title;
    Platform::Date asked;  ///< Whether to show it.
    std::uint64_t order = 0;
    std::optional<bool> isToShow{};  ///< Once the host has been told.
    int shown = 0;
    int maxShown = 1;
    int settled = 0;  ///< How many of them have certainly been noted.
  };

  std::map<std::string, Plan> plans;
  std::map<std::string, Delivery> deliveries;
  std::uint64_t count = 0;

  void deliver(const std::string& identifier, const std::string& title, Platform::Date now) {
    deliveries.insert_or_assign(identifier,
                                Delivery{.title = title, .asked = now, .order = ++count});
  }

  void plan(const std::string& identifier, Plan plan, const Almanac& almanac) {
    plan.date = plan.at(0, almanac);
    plans.insert_or_assign(identifier, std::move(plan));
  }

  /// The user is in another time zone.
  void travel(const Almanac& almanac) {
    for (auto& [identifier, plan] : plans) plan.date = plan.at(plan.next, almanac);
  }

  /// Somebody who is awake looks at the clock. Dates that passed unseen count as one. After a clock
  /// that was wrong by more than a period and two days, the series goes on from the present.
  void look(Platform::Date now, const Almanac& almanac) {
    std::vector<std::pair<Platform::Date, std::string>> due;
    for (auto& [identifier, plan] : plans)
      if (plan.date <= now)
        due.emplace_back(plan.date, identifier);
      else if (plan.repeats() && plan.next > 0 && now + std::chrono::days(2) < plan.date &&
               now + std::chrono::days(2) < plan.at(plan.next - 2, almanac))
        plan.skipTo(now, 0, almanac);
    std::sort(due.begin(), due.end());
    for (const auto& [date, identifier] : due) {
      const auto plan = plans.find(identifier);
      deliver(identifier, plan->second.title, now);
      if (plan->second.repeats())
        plan->second.skipTo(now, plan->second.next, almanac);
      else
        plans.erase(plan);
    }
  }

  [[nodiscard]] Delivery* find(const std::string& title) {
    const auto found = std::find_if(deliveries.begin(), deliveries.end(),
                                    [&](const auto& each) { return each.second.title == title; });
    return found == deliveries.end() ? nullptr : &found->second;
  }
};

}  // namespace Varnel::Tests
