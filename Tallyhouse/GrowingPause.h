// SPDX-License-Identifier: MIT
#pragma once

#include <algorithm>
#include <chrono>

#include <Varnel/Platform/Values/Date.h>

namespace Tallyhouse {

/// When to try once more what fails again and again: ever later, at last once in half a minute. A
/// plain value, whose owner gives it the time.
class GrowingPause final {
 public:
  void failed(Varnel::Platform::Date now) {
    end_ = now + pause_;
    pause_ = std::min(2 * pause_, max);
  }

  [[nodiscard]] Varnel::Platform::Date end() const { return end_; }

  /// An end too far away is one of before the clock was set back.
  [[nodiscard]] bool isOver(Varnel::Platform::Date now) const {
    return end_ <= now || end_ > now + max;
  }

 private:
  static constexpr std::chrono::milliseconds max = std::chrono::seconds(30);

  std::chrono::milliseconds pause_{10};
  Varnel::Platform::Date end_;
};

}  // namespace Tallyhouse
