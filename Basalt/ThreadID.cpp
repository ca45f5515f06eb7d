// SPDX-License-Identifier: MIT
#include <Varnel/Basalt/ThreadID.h>

#include <atomic>

namespace Basalt {
namespace {

std::atomic<std::uint64_t> lastID = 0;
// Read for every grant of a queue. With this model the read is a plain load.
[[gnu::tls_model("initial-exec")]] constinit thread_local ThreadID currentID = ThreadID::none;

}  // namespace

ThreadID currentThreadID() noexcept {
  if (currentID == ThreadID::none) [[unlikely]]
    currentID = static_cast<ThreadID>(lastID.fetch_add(1, std::memory_order_relaxed) + 1);
  return currentID;
}

}  // namespace Basalt
