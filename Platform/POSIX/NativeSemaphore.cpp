// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Concurrency/NativeSemaphore.h>

#include <semaphore.h>

#include <algorithm>
#include <cerrno>
#include <ctime>
#include <new>

namespace Varnel::Platform {
namespace {

sem_t* native(std::byte* storage) {
  return std::launder(reinterpret_cast<sem_t*>(storage));
}

timespec timeSpecOf(Date date) {
  using std::chrono::duration_cast;
  const auto sinceEpoch = std::max(date, Date()).time_since_epoch();
  const auto seconds = duration_cast<std::chrono::seconds>(sinceEpoch);
  const auto fraction = duration_cast<std::chrono::nanoseconds>(sinceEpoch - seconds);
  return {.tv_sec = static_cast<std::time_t>(seconds.count()),
          .tv_nsec = static_cast<long>(fraction.count())};
}

}  // namespace

NativeSemaphore::NativeSemaphore(unsigned count) {
  static_assert(sizeof(sem_t) <= storageSize && alignof(sem_t) <= alignof(std::max_align_t));
  ::sem_init(new (storage_) sem_t, 0, count);
}

NativeSemaphore::~NativeSemaphore() {
  ::sem_destroy(native(storage_));
}

void NativeSemaphore::post() {
  ::sem_post(native(storage_));
}

void NativeSemaphore::wait() {
  while (::sem_wait(native(storage_)) != 0 && errno == EINTR) {
  }
}

bool NativeSemaphore::waitUntil(Date deadline) {
  const timespec limit = timeSpecOf(deadline);
  int status;
  while ((status = ::sem_timedwait(native(storage_), &limit)) != 0 && errno == EINTR) {
  }
  return status == 0;
}

}  // namespace Varnel::Platform
