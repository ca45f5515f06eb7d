// SPDX-License-Identifier: MIT
#pragma once

#include <algorithm>
#include <condition_variable>
#include <cstddef>
#include <deque>
#include <memory>
#include <mutex>

#include <Varnel/Basalt/Block.h>

namespace Varnel {

/// Threads that are started on need and end when they have been idle for a second. Held by
/// `std::shared_ptr`, by each of them too. Any thread.
class DiskReadingWorkers final : public std::enable_shared_from_this<DiskReadingWorkers> {
 public:
  /// Runs the block on a thread that does nothing else. When the system grants no more threads it
  /// waits for one of those that there are; throws `std::system_error` when there are none.
  void run(Basalt::Block block);

 private:
  void work();

  std::mutex mutex_;  ///< Owns what follows.
  std::condition_variable arrived_;
  std::deque<Basalt::Block> waiting_;
  std::size_t threads_ = 0;
  std::size_t idle_ = 0;
};

/// Blocks that wait for one of a few workers, in order. A block that is stuck does not count among
/// them, as far as threads are to be had. Held by `std::shared_ptr`. Any thread.
class DiskReadingJobs final : public std::enable_shared_from_this<DiskReadingJobs> {
 public:
  DiskReadingJobs(std::shared_ptr<DiskReadingWorkers> workers, std::size_t maxRunning)
      : workers_(std::move(workers)), maxRunning_(maxRunning) {}

  /// Throws as `DiskReadingWorkers::run` does, without keeping the block.
  void add(Basalt::Block block);

  /// A block that runs has got stuck, or goes on after that.
  void didGetStuck();
  void goesOn();

 private:
  static constexpr std::size_t maxStuck = 256;

  [[nodiscard]] std::size_t room() const { return maxRunning_ + std::min(stuck_, maxStuck); }
  void startWorker();
  void work();

  const std::shared_ptr<DiskReadingWorkers> workers_;
  const std::size_t maxRunning_;
  std::mutex mutex_;  ///< Owns what follows.
  std::deque<Basalt::Block> waiting_;
  std::size_t running_ = 0;
  std::size_t stuck_ = 0;  ///< Of those that run.
};

}  // namespace Varnel
