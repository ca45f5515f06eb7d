// SPDX-License-Identifier: MIT
#pragma once

#include <memory>
#include <utility>

#include <Varnel/Basalt/Executor.h>
#include <Varnel/Platform/Ports/MainQueue.h>

namespace Basalt {

/// Runs blocks on a main queue, which must outlive it, in the order in which it is given them. Any
/// thread.
///
///     channel.onUpdate(std::make_shared<MainQueueExecutor>(mainQueue), show);
class MainQueueExecutor final : public Executor {
 public:
  explicit MainQueueExecutor(Varnel::Platform::MainQueue& queue) : queue_(queue) {}

  void execute(Block block) override {
    // The queue's blocks can be copied, ours cannot.
    queue_.post([shared = std::make_shared<Block>(std::move(block))] { (*shared)(); });
  }

 private:
  Varnel::Platform::MainQueue& queue_;
};

}  // namespace Basalt
