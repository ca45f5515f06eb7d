// SPDX-License-Identifier: MIT
#include <condition_variable>
#include <cstddef>
#include <deque>
#include <mutex>
#include <system_error>
#include <utility>

#include <Varnel/Basalt/Executor.h>
#include <Varnel/Platform/Concurrency/StartThread.h>

namespace Basalt {
namespace {

// A pool of our own, small as it is: the one among the libraries that are linked anyway is GLib's,
// which a system without GLib lacks, and whose threads would neither have our names nor leave the
// host's signals alone. The parallel algorithms of the standard library need a library of their
// own.
class ConcurrentQueue final : public Executor {
 public:
  void execute(Block block) override {
    const std::lock_guard lock(mutex_);
    waiting_.push_back(std::move(block));
    if (idle_ >= waiting_.size() || threads_ == maxThreads) {
      arrived_.notify_one();
      return;
    }
    try {
      Varnel::Platform::startThread("concurrent", [this] { work(); }).detach();
      ++threads_;
    } catch (const std::system_error&) {
      // The threads that already run will get to the block.
      if (threads_ > 0) return;
      waiting_.pop_back();
      throw;
    }
  }

 private:
  static constexpr std::size_t maxThreads = 64;

  void work() {
    std::unique_lock lock(mutex_);
    while (true) {
      ++idle_;
      arrived_.wait(lock, [&] { return !waiting_.empty(); });
      --idle_;
      Block block = std::move(waiting_.front());
      waiting_.pop_front();
      lock.unlock();
      block();
      block = {};
      lock.lock();
    }
  }

  std::mutex mutex_;  // Owns everything below.
  std::condition_variable arrived_;
  std::deque<Block> waiting_;
  std::size_t threads_ = 0;
  std::size_t idle_ = 0;
};

}  // namespace

// The queue is never destroyed, because its threads outlive main.
std::shared_ptr<Executor> globalConcurrentQueue() {
  static const auto& queue = *new std::shared_ptr<Executor>(std::make_shared<ConcurrentQueue>());
  return queue;
}

}  // namespace Basalt
