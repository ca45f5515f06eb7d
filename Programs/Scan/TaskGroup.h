// SPDX-License-Identifier: MIT
#pragma once

#include <atomic>
#include <condition_variable>
#include <exception>
#include <functional>
#include <mutex>
#include <optional>

#include <Scan/DiskTurns.h>

namespace Orvane {

struct ScanControl;

/// Tasks that are waited for together, and one of whose failures ends all. Tasks may start others.
///
///     TaskGroup group(turns, control);
///     group.start(disk, task);
///     group.wait();
///
/// Any thread but for `wait`. It outlives its tasks' work, not the tasks.
class TaskGroup final {
 public:
  /// What a task does. Unlike a `DiskTask` it may throw, and it may be dropped without a last call.
  class Task {
   public:
    virtual ~Task() = default;
    /// As `DiskTask::run`. Once `shouldStop`, it answers soon that it is done.
    [[nodiscard]] virtual std::optional<std::uint64_t> run(DiskTurn& turn) = 0;
    virtual void refuse() = 0;
  };

  TaskGroup(DiskTurns& turns, const ScanControl& control) : turns_(turns), control_(control) {}
  TaskGroup(const TaskGroup&) = delete;
  TaskGroup& operator=(const TaskGroup&) = delete;

  void start(const ScanDisk& disk, std::unique_ptr<Task> task);

  /// Waits for all tasks, and throws what one of them threw.
  void wait();

  /// Whether the scan was cancelled or a task failed.
  [[nodiscard]] bool shouldStop() const;

 private:
  class Guarded;

  void end(std::exception_ptr failure);

  DiskTurns& turns_;
  const ScanControl& control_;
  std::atomic<bool> hasFailed_{false};
  std::mutex mutex_;  ///< Guards what follows.
  std::condition_variable ended_;
  std::size_t running_ = 0;
  std::exception_ptr failure_;
};

}  // namespace Orvane
