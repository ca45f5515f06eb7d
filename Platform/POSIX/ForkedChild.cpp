// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Concurrency/ForkedChild.h>

#include <pthread.h>

#include <atomic>

namespace Varnel::Platform {

void callInForkedChildren(void (*function)()) {
  ::pthread_atfork(nullptr, nullptr, function);
}

void callBeforeForks(void (*function)()) {
  ::pthread_atfork(function, nullptr, nullptr);
}

int forksSoFar() {
  static std::atomic<int> forks = 0;
  [[maybe_unused]] static const bool isTold = [] {
    callInForkedChildren([] { ++forks; });
    return true;
  }();
  return forks.load(std::memory_order_relaxed);
}

}  // namespace Varnel::Platform
