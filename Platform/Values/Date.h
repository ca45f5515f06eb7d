// SPDX-License-Identifier: MIT
#pragma once

#include <chrono>

namespace Varnel::Platform {

/// A moment of the wall clock, in microseconds since 1970-01-01 UTC. Unlike the nanosecond clock it
/// spans some 292,000 years either way, so that "in a thousand years" is a date like any other.
///
///     Date soon = clock.now() + 1500ns;                     // a microsecond later
///     Date launch = std::chrono::sys_days(2016y / 5 / 9);
///
/// A value, and a time point of the standard library. Anything finer than a microsecond is cut off,
/// towards the past.
class Date final : public std::chrono::sys_time<std::chrono::microseconds> {
 public:
  using Point = std::chrono::sys_time<std::chrono::microseconds>;

  /// 1970-01-01 UTC.
  constexpr Date() = default;
  constexpr explicit Date(duration sinceEpoch) : Point(sinceEpoch) {}
  template <typename Duration>
  constexpr Date(std::chrono::sys_time<Duration> point)
      : Point(std::chrono::floor<duration>(point)) {}

  // As dates, for which a step in nanoseconds does not overflow.
  [[nodiscard]] static constexpr Date min() noexcept { return Date(duration::min()); }
  [[nodiscard]] static constexpr Date max() noexcept { return Date(duration::max()); }

  template <typename Rep, typename Period>
  friend constexpr Date operator+(Date date, std::chrono::duration<Rep, Period> step) {
    return Date(date.time_since_epoch() + std::chrono::floor<duration>(step));
  }
  template <typename Rep, typename Period>
  friend constexpr Date operator-(Date date, std::chrono::duration<Rep, Period> step) {
    return date + -step;
  }
};

/// A length of time in seconds, with fractions; the unit in which time-outs and timings are given.
using TimeInterval = double;

/// The length from `start` to `end` in seconds, negative when `end` lies before `start`.
[[nodiscard]] inline TimeInterval intervalBetween(Date start, Date end) {
  return std::chrono::duration<double>(end - start).count();
}

}  // namespace Varnel::Platform
