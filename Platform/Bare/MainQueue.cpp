// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Ports/MainQueue.h>

#include <fcntl.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <chrono>
#include <condition_variable>
#include <cstddef>
#include <deque>
#include <mutex>
#include <thread>
#include <utility>

#include <Varnel/Platform/Bare/Adapters.h>
#include <Varnel/Platform/POSIX/FileDescriptor.h>

namespace Varnel::Platform::Bare {
namespace {

// POSIX does not tell which thread is the main one; a program loads its libraries on it.
const std::thread::id mainThread = std::this_thread::get_id();

// A pipe with one byte in it, or none.
class Signal final {
 public:
  Signal() {
    std::array<int, 2> ends{-1, -1};
    if (::pipe(ends.data()) != 0) return;
    readEnd_ = POSIX::FileDescriptor(ends[0]);
    writeEnd_ = POSIX::FileDescriptor(ends[1]);
    for (const int end : {readEnd_.get(), writeEnd_.get()}) {
      ::fcntl(end, F_SETFD, FD_CLOEXEC);
      ::fcntl(end, F_SETFL, O_NONBLOCK);
    }
  }

  void set(bool isSet) {
    char byte = 0;
    if (isSet_ == isSet) return;
    isSet_ = isSet;
    [[maybe_unused]] const ssize_t done =
        isSet ? ::write(writeEnd_.get(), &byte, 1) : ::read(readEnd_.get(), &byte, 1);
  }

  [[nodiscard]] std::optional<int> descriptor() const {
    return readEnd_ && writeEnd_ ? std::optional(readEnd_.get()) : std::nullopt;
  }

 private:
  POSIX::FileDescriptor readEnd_;
  POSIX::FileDescriptor writeEnd_;
  bool isSet_ = false;
};

class OwnQueue final : public MainQueue {
 public:
  void post(Block block) override {
    const std::lock_guard lock(mutex_);
    blocks_.push_back(std::move(block));
    if (signal_) signal_->set(true);
    posted_.notify_one();
  }

  bool isCurrent() const override { return std::this_thread::get_id() == mainThread; }

  void run() override {
    runWhile([this] { return stops_ == 0; });
    --stops_;
  }

  void stop() override {
    post([this] { ++stops_; });
  }

  void runWhile(const std::function<bool()>& condition) override {
    while (condition()) {
      {
        std::unique_lock lock(mutex_);
        posted_.wait(lock, [this] { return !blocks_.empty(); });
      }
      runNext();
    }
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

  bool drain() override {
    bool any = false;
    while (runNext()) any = true;
    return any;
  }

  std::optional<int> descriptor() override {
    const std::lock_guard lock(mutex_);
    if (!signal_) signal_.emplace().set(!blocks_.empty());
    return signal_->descriptor();
  }

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
    if (signal_) signal_->set(!blocks_.empty());
    lock.unlock();
    block();
    return true;
  }

  std::mutex mutex_;  ///< Owns what follows.
  std::condition_variable posted_;
  std::deque<Block> blocks_;
  std::optional<Signal> signal_;  ///< Is set while there are blocks; none until it is asked for.
  // The members below belong to the main thread.
  int stops_ = 0;  ///< How many runs are to end. Main thread only.
};

}  // namespace

std::unique_ptr<MainQueue> makeMainQueue() {
  return std::make_unique<OwnQueue>();
}

}  // namespace Varnel::Platform::Bare
