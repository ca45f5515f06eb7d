// SPDX-License-Identifier: MIT
#include <Scan/ThreadTeam.h>

#include <exception>
#include <mutex>
#include <thread>

#include <Varnel/Platform/Concurrency/StartThread.h>

namespace Orvane {

void runOnThreads(unsigned count, const std::function<void(unsigned)>& work) {
  std::mutex mutex;
  std::exception_ptr failure;
  const auto guarded = [&](unsigned worker) {
    try {
      work(worker);
    } catch (...) {
      const std::lock_guard lock(mutex);
      failure = std::current_exception();
    }
  };
  std::vector<std::thread> helpers;
  helpers.reserve(count);
  try {
    for (unsigned worker = 1; worker < count; ++worker)
      helpers.push_back(Varnel::Platform::startThread("scan", [&, worker] { guarded(worker); }));
  } catch (const std::exception&) {
    // Out of threads or memory: the threads that already run do the work.
  }
  guarded(0);
  for (std::thread& helper : helpers) helper.join();
  if (failure) std::rethrow_exception(failure);
}

WorkLanes::WorkLanes(const std::vector<std::size_t>& ends) : lanes_(ends.size()) {
  std::size_t begin = 0;
  for (std::size_t i = 0; i < ends.size(); ++i) {
    lanes_[i].next = begin;
    lanes_[i].end = begin = ends[i];
  }
}

bool WorkLanes::next(unsigned worker, std::size_t& index) {
  for (std::size_t i = 0; i < lanes_.size(); ++i) {
    Lane& lane = lanes_[(worker + i) % lanes_.size()];
    index = lane.next.fetch_add(1, std::memory_order_relaxed);
    if (index < lane.end) return true;
  }
  return false;
}

}  // namespace Orvane
