// SPDX-License-Identifier: MIT
#include <Scan/TaskGroup.h>

#include <utility>

#include <Scan/ScanObserver.h>

namespace Orvane {

/// A task whose failures the group keeps. It is dropped before the group hears of its end.
class TaskGroup::Guarded final : public DiskTask {
 public:
  Guarded(TaskGroup& group, std::unique_ptr<Task> task) : group_(group), task_(std::move(task)) {}

  std::optional<std::uint64_t> run(DiskTurn& turn) override {
    std::optional<std::uint64_t> next;
    guarded([&] {
      next = task_->run(turn);
      return next.has_value();
    });
    return next;
  }

  void refuse() override {
    guarded([&] {
      task_->refuse();
      return false;
    });
  }

 private:
  template <typename Work>
  void guarded(const Work& goesOn) {
    std::exception_ptr failure;
    try {
      if (goesOn()) return;
    } catch (...) {
      failure = std::current_exception();
      group_.hasFailed_ = true;
    }
    task_.reset();
    group_.end(failure);
  }

  TaskGroup& group_;
  std::unique_ptr<Task> task_;
};

void TaskGroup::start(const ScanDisk& disk, std::unique_ptr<Task> task) {
  {
    const std::lock_guard lock(mutex_);
    ++running_;
  }
  try {
    turns_.start(disk, std::make_shared<Guarded>(*this, std::move(task)));
  } catch (...) {
    hasFailed_ = true;
    end(std::current_exception());
  }
}

void TaskGroup::wait() {
  std::unique_lock lock(mutex_);
  ended_.wait(lock, [&] { return running_ == 0; });
  if (failure_) std::rethrow_exception(std::exchange(failure_, nullptr));
}

bool TaskGroup::shouldStop() const {
  return control_.isCancelled.load(std::memory_order_relaxed) ||
         hasFailed_.load(std::memory_order_relaxed);
}

void TaskGroup::end(std::exception_ptr failure) {
  const std::lock_guard lock(mutex_);
  if (failure) failure_ = std::move(failure);
  // Under the lock: the group may be gone right after it.
  if (--running_ == 0) ended_.notify_all();
}

}  // namespace Orvane
