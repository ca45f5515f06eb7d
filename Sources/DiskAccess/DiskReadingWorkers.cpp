// SPDX-License-Identifier: MIT
#include <Varnel/DiskAccess/DiskReadingWorkers.h>

#include <chrono>
#include <system_error>
#include <utility>

#include <Varnel/Platform/Concurrency/StartThread.h>

namespace Varnel {
namespace {

// Runs the first block without the lock, and lets go of what it owns before it is taken again.
void runFirst(std::deque<Basalt::Block>& waiting, std::unique_lock<std::mutex>& lock) {
  Basalt::Block block = std::move(waiting.front());
  waiting.pop_front();
  lock.unlock();
  block();
  block = {};
  lock.lock();
}

}  // namespace

void DiskReadingWorkers::run(Basalt::Block block) {
  const std::lock_guard lock(mutex_);
  waiting_.push_back(std::move(block));
  if (idle_ >= waiting_.size()) {
    arrived_.notify_one();
    return;
  }
  try {
    Platform::startThread("disk-reading", [self = shared_from_this()] { self->work(); }).detach();
    ++threads_;
  } catch (const std::system_error&) {
    if (threads_ > 0) return;
    waiting_.pop_back();
    throw;
  }
}

void DiskReadingWorkers::work() {
  constexpr std::chrono::seconds maxIdleTime{1};
  std::unique_lock lock(mutex_);
  while (true) {
    ++idle_;
    const bool isNeeded =
        arrived_.wait_for(lock, maxIdleTime, [this] { return !waiting_.empty(); });
    --idle_;
    if (!isNeeded) break;
    runFirst(waiting_, lock);
  }
  --threads_;
}

void DiskReadingJobs::add(Basalt::Block block) {
  const std::lock_guard lock(mutex_);
  if (running_ < room()) {
    try {
      startWorker();
    } catch (const std::system_error&) {
      if (running_ == 0) throw;
    }
  }
  waiting_.push_back(std::move(block));
}

void DiskReadingJobs::startWorker() {
  workers_->run([self = shared_from_this()] { self->work(); });
  ++running_;
}

void DiskReadingJobs::didGetStuck() {
  const std::lock_guard lock(mutex_);
  ++stuck_;
  if (waiting_.empty() || running_ >= room()) return;
  try {
    startWorker();
  } catch (const std::system_error&) {
    // Then they wait for one that goes on.
  }
}

void DiskReadingJobs::goesOn() {
  const std::lock_guard lock(mutex_);
  --stuck_;
}

void DiskReadingJobs::work() {
  std::unique_lock lock(mutex_);
  while (!waiting_.empty() && running_ <= room()) {
    runFirst(waiting_, lock);
  }
  --running_;
}

}  // namespace Varnel
