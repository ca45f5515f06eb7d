// SPDX-License-Identifier: MIT
#pragma once

#include <algorithm>
#include <chrono>

#include <Varnel/Platform/Values/Date.h>

namespace Varnel::Platform {

/// When to try once more what fails again and again: after a pause that doubles from `min` to
/// `max`. A plain value, whose owner gives it the time.
class GrowingPause final {
 public:
  using Duration = std::chrono::milliseconds;

  GrowingPause(Duration min, Duration max) : min_(min), max_(max) {}

  void failed(Date now) {
    last_ = std::clamp(2 * last_, min_, max_);
    end_ = now + last_;
  }
  void succeeded() { *this = {min_, max_}; }

  [[nodiscard]] Date end() const { return end_; }

  /// An end too far away is one of before the clock was set back.
  [[nodiscard]] bool isOver(Date now) const { return end_ <= now || end_ > now + last_; }

 private:
  Duration min_;
  Duration max_;
  Duration last_{};
  Date end_;
};

}  // namespace Varnel::Platform
