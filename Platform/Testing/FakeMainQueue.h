// SPDX-License-Identifier: MIT
#pragma once

#include <algorithm>
#include <chrono>
#include <condition_variable>
#include <cstddef>
#include <deque>
#include <functional>
#include <mutex>
#include <thread>
#include <utility>

#include <Varnel/Platform/Ports/MainQueue.h>

namespace Varnel::Platform::Testing {

/// A main queue that runs its blocks when the test says so. The thread that made it counts as the
/// main thread.
///
///     FakeMainQueue queue;
///     queue.post([&] { done = true; });
///     queue.drain();
class FakeMainQueue final : public MainQueue {
 public:
  void post(Block block) override {
    // Told within the lock: a test that has seen the block run may destroy the queue at once.
    const std::lock_guard lock(mutex_);
    blocks_.push_back(std::move(block));
    posted_.notify_one();
  }

  [[nodiscard]] bool isCurrent() const override {
    return std::this_thread::get_id() == mainThread_;
  }

  void run() override {
    runWhile([this] { return stops_ == 0; });
    --stops_;
  }

  void runWhile(const std::function<bool()>& condition) override {
    while (!runWhile(condition, std::chrono::hours(1))) continue;
  }
  bool runWhile(const std::function<bool()>& condition,
                std::chrono::milliseconds patience) override {
    constexpr std::chrono::milliseconds longest = std::chrono::years(1);
    const auto end = std::chrono::steady_clock::now() + std::min(patience, longest);
    for (std::size_t due = waitingBlocks(); condition(); runNext()) {
      if (due > 0) {
        --due;
        continue;
      }
      if (std::chrono::steady_clock::now() >= end) return false;
      std::unique_lock lock(mutex_);
      posted_.wait_until(lock, end, [this] { return !blocks_.empty(); });
    }
    return true;
  }

  void stop() override {
    post([this] { ++stops_; });
  }

  bool drain() override {
    bool any = false;
    while (runNext()) any = true;
    return any;
  }

  [[nodiscard]] std::optional<int> descriptor() override { return std::nullopt; }

 private:
  std::size_t waitingBlocks() {
    const std::lock_guard lock(mutex_);
    return blocks_.size();
  }

  bool runNext() {
    std::unique_lock lock(mutex_);
    if (blocks_.empty()) return false;
    const Block block = std::move(blocks_.front());
    blocks_.pop_front();
    lock.unlock();
    block();
    return true;
  }

  const std::thread::id mainThread_ = std::this_thread::get_id();
  std::mutex mutex_;  ///< Owns `blocks_`.
  std::condition_variable posted_;
  std::deque<Block> blocks_;
  int stops_ = 0;  ///< How many runs are to end. Main thread only.
};

}  // namespace Varnel::Platform::Testing
