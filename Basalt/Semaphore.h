// SPDX-License-Identifier: MIT
#pragma once

#include <Varnel/Platform/Concurrency/NativeSemaphore.h>
#include <Varnel/Platform/Values/Date.h>

namespace Basalt {

/// A counting semaphore. `signal` costs a system call only when a thread sleeps on it.
///
///     Semaphore done;
///     std::thread worker([&] { work(); done.signal(); });
///     done.wait();
///
/// Any thread. It must outlive every call of `signal`, also one that has already woken its waiter:
/// share the semaphore, or be sure that the signalling thread has left the call.
class Semaphore final {
 public:
  explicit Semaphore(unsigned count = 0) : semaphore_(count) {}
  Semaphore(const Semaphore&) = delete;
  Semaphore& operator=(const Semaphore&) = delete;

  void signal() { semaphore_.post(); }
  void wait() { semaphore_.wait(); }

  /// Waits until a wall-clock time, for ever when it is `Date::max()`. Returns false when the time
  /// came first; a signal that has already come is taken even when the time has passed.
  [[nodiscard]] bool waitUntil(Varnel::Platform::Date deadline) {
    if (deadline != Varnel::Platform::Date::max()) return semaphore_.waitUntil(deadline);
    semaphore_.wait();
    return true;
  }

 private:
  Varnel::Platform::NativeSemaphore semaphore_;
};

}  // namespace Basalt
