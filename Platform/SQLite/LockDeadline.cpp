// SPDX-License-Identifier: MIT
#include <Varnel/Platform/SQLite/LockDeadline.h>

#include <algorithm>
#include <thread>

namespace Varnel::Platform {
namespace {

constexpr std::chrono::microseconds minPause{100};
constexpr std::chrono::microseconds maxPause{1000};

}  // namespace

void LockDeadline::restart() {
  next_ = {};
}

bool LockDeadline::pause() {
  const auto now = Clock::now();
  if (next_ == std::chrono::microseconds::zero()) {
    next_ = minPause;
    end_ = now + max_;
  }
  if (now >= end_) return false;
  std::this_thread::sleep_for(std::min<Clock::duration>(next_, end_ - now));
  next_ = std::min(2 * next_, maxPause);
  return true;
}

}  // namespace Varnel::Platform
