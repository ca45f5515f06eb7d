// SPDX-License-Identifier: MIT
#pragma once

#include <chrono>
#include <optional>

#include <Varnel/Platform/Values/Date.h>

namespace Varnel {

/// The moment at which a wait of `timeout` seconds that starts now is over. `Date::max()`, for
/// ever, without a time-out, with one that is not a number, and with one that leads beyond all
/// dates; now with a negative one.
[[nodiscard]] inline Platform::Date waitingDeadline(Platform::Date now,
                                                    std::optional<Platform::TimeInterval> timeout) {
  using Seconds = std::chrono::duration<Platform::TimeInterval>;
  if (!timeout) return Platform::Date::max();
  if (*timeout <= 0) return now;
  const Seconds rest =
      Seconds(Platform::Date::max().time_since_epoch()) - Seconds(now.time_since_epoch());
  // False for what is not a number. Close to the end of time the sum would be inexact.
  if (!(Seconds(*timeout) < rest / 2)) return Platform::Date::max();
  return now + std::chrono::duration_cast<Platform::Date::duration>(Seconds(*timeout));
}

/// The same as a span of time that a clock which is never set can measure: none for ever.
[[nodiscard]] inline std::optional<std::chrono::nanoseconds> maxWaitingTime(
    std::optional<Platform::TimeInterval> timeout) {
  constexpr Platform::TimeInterval forEver = 1e9;
  if (!timeout) return std::nullopt;
  if (*timeout <= 0) return std::chrono::nanoseconds::zero();
  if (!(*timeout < forEver)) return std::nullopt;
  using Seconds = std::chrono::duration<Platform::TimeInterval>;
  return std::chrono::duration_cast<std::chrono::nanoseconds>(Seconds(*timeout));
}

}  // namespace Varnel
