// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <optional>
#include <string>

#include <Varnel/Platform/Values/UserNotification.h>

namespace Varnel::Platform {

class Calendar;

/// A scheduled notification and how many of its deliveries have been made. Its `deliveryDate` is
/// the original one, from which every repetition is counted. A plain value.
struct NotificationSchedule final {
  std::string key;  ///< Names it in the store.
  UserNotification notification;
  /// The time zone in which it was scheduled. Wherever the user travels, it comes at the same time
  /// by the local clocks.
  std::string timeZone;
  std::int64_t deliveryCount = 0;

  bool operator==(const NotificationSchedule&) const = default;
};

/// What is to be done about a schedule now.
struct ScheduleDecision final {
  bool isDue = false;
  /// The schedule's `deliveryCount` from now on; absent when no delivery is left.
  std::optional<std::int64_t> deliveryCount;

  bool operator==(const ScheduleDecision&) const = default;
};

/// The date of the next delivery, by the user's present calendar; absent when the calendar does not
/// reach that far: then the delivery never comes.
[[nodiscard]] std::optional<Date> nextDate(const NotificationSchedule& schedule,
                                           const Calendar& calendar);

/// Whether the schedule is due, and how it goes on. Periods that passed unseen count as one. Where
/// the calendar cannot count days, having no library, the next delivery waits for one that can.
///
/// A clock that is set back repeats nothing that has been delivered. A clock that is set back by
/// more than a period and some days must have been wrong before: then the schedule goes on from the
/// present. But one that is set back to a year before 2026 is wrong itself, as at the start of a
/// machine that has yet to ask for the time.
[[nodiscard]] ScheduleDecision decide(const NotificationSchedule& schedule, Date now,
                                      const Calendar& calendar);

}  // namespace Varnel::Platform
