// SPDX-License-Identifier: MIT
#include <Benchmarks/AllocationCounter.h>

#include <atomic>
#include <cstdlib>
#include <new>

namespace {
std::atomic<std::size_t> count = 0;
}

void* operator new(std::size_t size) {
  count.fetch_add(1, std::memory_order_relaxed);
  if (void* memory = std::malloc(size)) return memory;
  throw std::bad_alloc();
}

void operator delete(void* memory) noexcept {
  std::free(memory);
}

void operator delete(void* memory, std::size_t) noexcept {
  std::free(memory);
}

namespace Varnel::Benchmarks {

std::size_t allocationCount() {
  return count;
}

}  // namespace Varnel::Benchmarks
