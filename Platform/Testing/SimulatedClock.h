// SPDX-License-Identifier: MIT
#pragma once

#include <atomic>

#include <Varnel/Platform/Ports/Clock.h>

namespace Varnel::Platform::Testing {

/// A clock that stands still until the test moves it. Any thread.
///
///     SimulatedClock clock(Date(std::chrono::sys_days(2026y / 3 / 14)));
///     clock.advance(std::chrono::hours(24));
class SimulatedClock final : public Clock {
 public:
  /// The start is 1970-01-01 UTC unless given.
  explicit SimulatedClock(Date start = {}) : now_(start) {}

  [[nodiscard]] Date now() const override { return now_.load(); }

  void set(Date now) { now_.store(now); }
  template <typename Rep, typename Period>
  void advance(std::chrono::duration<Rep, Period> step) {
    Date before = now_.load();
    while (!now_.compare_exchange_weak(before, before + step)) {
    }
  }

 private:
  std::atomic<Date> now_;
};

}  // namespace Varnel::Platform::Testing
