// SPDX-License-Identifier: MIT
#pragma once

#include <poll.h>

#include <chrono>

#include <Varnel/Platform/Ports/MainQueue.h>

namespace Varnel::Tests {

/// Waits until the descriptor is readable, at most as long as given.
inline bool isReadable(int descriptor, std::chrono::milliseconds longest) {
  pollfd entry{.fd = descriptor, .events = POLLIN, .revents = 0};
  return ::poll(&entry, 1, static_cast<int>(longest.count())) == 1;
}

/// Runs the blocks of a main queue that has a descriptor until the condition holds; false when it
/// does not within half a minute.
template <typename Condition>
bool drainUntil(Platform::MainQueue& queue, Condition condition) {
  using Clock = std::chrono::steady_clock;
  const auto deadline = Clock::now() + std::chrono::seconds(30);
  while (!condition()) {
    const auto left =
        std::chrono::duration_cast<std::chrono::milliseconds>(deadline - Clock::now());
    if (left.count() <= 0 || !isReadable(*queue.descriptor(), left)) return false;
    queue.drain();
  }
  return true;
}

}  // namespace Varnel::Tests
