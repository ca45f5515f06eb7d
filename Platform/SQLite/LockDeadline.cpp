// SPDX-License-Identifier: MIT
#include <Varnel/Platform/SQLite/LockDeadline.h>

#include <algorithm>
#include <thread>

namespace Varnel::Platform {
namespace {

constexpr std::chrono::microseconds maxPause{1000};

}  // namespace

void LockDeadline::restart() {
  left_ = max_;
  next_ = minPause;
}

bool LockDeadline::pause() {
  if (left_ <= Clock::duration::zero()) return false;
  const auto start = Clock::now();
  std::this_thread::sleep_for(std::min(next_, left_));
  left_ -= Clock::now() - start;
  next_ = std::min<Clock::duration>(2 * next_, maxPause);
  return true;
}

}  // namespace Varnel::Platform
