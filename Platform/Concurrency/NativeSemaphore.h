// SPDX-License-Identifier: MIT
#pragma once

#include <cstddef>

#include <Varnel/Platform/Api.h>
#include <Varnel/Platform/Values/Date.h>

namespace Varnel::Platform {

/// The system's counting semaphore, in place: no allocation, and no system call unless a thread
/// sleeps on it. Any thread. `Basalt::Semaphore` is the one to use.
class VARNEL_API NativeSemaphore final {
 public:
  explicit NativeSemaphore(unsigned count);
  ~NativeSemaphore();
  NativeSemaphore(const NativeSemaphore&) = delete;
  NativeSemaphore& operator=(const NativeSemaphore&) = delete;

  void post();
  void wait();

  /// False when the wall clock reached `deadline` first. A count that is already there is taken
  /// even then.
  [[nodiscard]] bool waitUntil(Date deadline);

 private:
  static constexpr std::size_t storageSize = 32;
  alignas(std::max_align_t) std::byte storage_[storageSize];
};

}  // namespace Varnel::Platform
