// SPDX-License-Identifier: MIT
#pragma once

#include <functional>
#include <memory>
#include <utility>

#include <Basalt/SerialQueue.h>
#include <Platform/Ports/MainQueue.h>

namespace Basalt {

/// Where a piece of work is to run: the main queue, or a serial queue.
///
///     channel.onUpdate(Executor(mainQueue), [](const Event& event) { show(event); });
///
/// A cheap value. Any thread. What it hands on runs later, in the order in which a thread handed it
/// on, and must not throw.
class Executor final {
 public:
  using Work = std::function<void()>;

  /// The queue must outlive the executor.
  explicit Executor(Varnel::Platform::MainQueue& queue)
      : execute_([&queue](Work work) { queue.post(std::move(work)); }) {}
  explicit Executor(std::shared_ptr<SerialQueue> queue)
      : execute_([queue = std::move(queue)](Work work) { queue->async(std::move(work)); }) {}

  void execute(Work work) const { execute_(std::move(work)); }

 private:
  std::function<void(Work)> execute_;
};

}  // namespace Basalt
