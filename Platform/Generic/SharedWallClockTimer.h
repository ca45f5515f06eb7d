// SPDX-License-Identifier: MIT
#pragma once

#include <functional>
#include <memory>
#include <optional>
#include <set>

#include <Varnel/Platform/Api.h>
#include <Varnel/Platform/Ports/WallClockTimer.h>

namespace Varnel::Platform {

class Clock;

/// One timer that several wait on, each as if it had one of its own.
///
///     SharedWallClockTimer shared(clock, timer);
///     const auto retries = shared.share();
///     retries->arm(clock.now() + 1s);
///
/// Main thread only. It outlives its shares.
class VARNEL_API SharedWallClockTimer final {
 public:
  /// Clock and timer outlive this. No one else uses the timer.
  SharedWallClockTimer(const Clock& clock, WallClockTimer& timer);
  ~SharedWallClockTimer();
  SharedWallClockTimer(const SharedWallClockTimer&) = delete;
  SharedWallClockTimer& operator=(const SharedWallClockTimer&) = delete;

  [[nodiscard]] std::unique_ptr<WallClockTimer> share();

 private:
  class Share;

  void rearm();
  void ring();

  const Clock& clock_;
  WallClockTimer& timer_;
  std::set<Share*> shares_;
  bool isRinging_ = false;
};

}  // namespace Varnel::Platform
