// SPDX-License-Identifier: MIT
#pragma once

#include <chrono>
#include <cstddef>

namespace Varnel {

/// When gathered log entries go to the file: as soon as there are `highWaterMark` bytes, or when
/// the first of them has waited for `interval`; but not more often than once in a `pause`, so that
/// the author of a burst, who pays for waking the writer, pays once.
struct LogWritePolicy {
  using Duration = std::chrono::steady_clock::duration;

  enum class Step {
    write,           ///< Write what has gathered.
    waitForMark,     ///< Sleep until the mark is reached or the interval is over.
    waitForAnyByte,  ///< Sleep until something gathers.
  };

  std::size_t highWaterMark = 4096;
  Duration interval = std::chrono::seconds(1);
  Duration pause = std::chrono::milliseconds(1);

  /// What the writer does next. `elapsed` is the time since the first waiting byte or, when none
  /// waits, since the last write: soon after a write the writer sleeps lightly, so that a steady
  /// stream of entries need not wake it for the first byte of each batch.
  [[nodiscard]] Step step(std::size_t waitingBytes, Duration elapsed) const {
    if (waitingBytes >= highWaterMark) return Step::write;
    if (elapsed < interval) return Step::waitForMark;
    return waitingBytes > 0 ? Step::write : Step::waitForAnyByte;
  }
};

}  // namespace Varnel
