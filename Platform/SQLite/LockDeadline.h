// SPDX-License-Identifier: MIT
#pragma once

#include <chrono>

namespace Varnel::Platform {

/// How much longer an operation may wait for locks of others, all its waits together. What it does
/// in between does not count.
///
///     LockDeadline deadline(std::chrono::milliseconds(20));
///     deadline.restart();                        // the operation begins
///     while (!lock()) if (!deadline.pause()) return busy;
///
/// One thread at a time.
class LockDeadline final {
 public:
  explicit LockDeadline(std::chrono::microseconds max) : max_(max), left_(max) {}

  /// Grants the whole time anew.
  void restart();

  /// Pauses briefly, the longer the more often it has paused; false, at once, when the time is up.
  [[nodiscard]] bool pause();

 private:
  using Clock = std::chrono::steady_clock;
  static constexpr std::chrono::microseconds minPause{100};

  const std::chrono::microseconds max_;
  Clock::duration left_;
  Clock::duration next_ = minPause;
};

}  // namespace Varnel::Platform
