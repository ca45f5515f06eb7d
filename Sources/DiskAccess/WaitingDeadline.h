// SPDX-License-Identifier: MIT
#pragma once

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

}  // namespace Varnel
