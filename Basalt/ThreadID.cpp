// SPDX-License-Identifier: MIT
#include <Basalt/ThreadID.h>

#include <atomic>

namespace Basalt {
namespace {

std::atomic<std::uint64_t> lastID = 0;
constinit thread_local ThreadID currentID = ThreadID::none;

}  // namespace

ThreadID currentThreadID() noexcept {
  if (currentID == ThreadID::none) [[unlikely]]
    currentID = static_cast<ThreadID>(lastID.fetch_add(1, std::memory_order_relaxed) + 1);
  return currentID;
}

}  // namespace Basalt
