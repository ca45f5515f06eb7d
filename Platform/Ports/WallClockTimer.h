// SPDX-License-Identifier: MIT
#pragma once

#include <functional>

#include <Varnel/Platform/Api.h>
#include <Varnel/Platform/Values/Date.h>

namespace Varnel::Platform {

/// Calls back when the wall clock reaches a date, also after the machine has slept.
///
/// Main thread only. The handler must not throw.
class VARNEL_API WallClockTimer {
 public:
  virtual ~WallClockTimer() = default;
  WallClockTimer& operator=(const WallClockTimer&) = delete;

  /// The handler is called on the main thread and never within `arm`: at the date or soon after it,
  /// and whenever the clock was set while the timer was armed. The timer is disarmed by then. The
  /// handler may arm it again or set another handler, but not destroy it.
  virtual void setHandler(std::function<void()> handler) = 0;

  /// Waits for this date instead of any earlier one. A date in the past counts as reached.
  virtual void arm(Date date) = 0;
  /// The handler is not called any more, even if the date has come.
  virtual void disarm() = 0;
};

}  // namespace Varnel::Platform
