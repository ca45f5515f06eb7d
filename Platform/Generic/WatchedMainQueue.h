// SPDX-License-Identifier: MIT
#pragma once

#include <atomic>
#include <chrono>
#include <memory>
#include <optional>

#include <Varnel/Platform/Api.h>
#include <Varnel/Platform/Ports/MainQueue.h>

namespace Varnel::Platform {

class SystemLog;

/// A main queue that reports to the system's log, once, when nobody runs it. The host's loop may
/// not know of the queue, and then posted blocks would silently wait for ever.
///
///     WatchedMainQueue queue(makeMainQueue(), systemLog);
///
/// The first post starts a thread, which ends when the first block runs or `patience` is over.
/// Later posts cost nothing more.
class VARNEL_API WatchedMainQueue final : public MainQueue {
 public:
  /// The log outlives the queue.
  WatchedMainQueue(std::unique_ptr<MainQueue> queue, SystemLog& systemLog,
                   std::chrono::milliseconds patience = std::chrono::seconds(10));
  ~WatchedMainQueue() override;
  WatchedMainQueue(const WatchedMainQueue&) = delete;
  WatchedMainQueue& operator=(const WatchedMainQueue&) = delete;

  void post(Block block) override;
  [[nodiscard]] bool isCurrent() const override { return queue_->isCurrent(); }
  void run() override { queue_->run(); }
  void stop() override { queue_->stop(); }
  void runWhile(const std::function<bool()>& condition) override { queue_->runWhile(condition); }
  bool runWhile(const std::function<bool()>& condition,
                std::chrono::milliseconds patience) override {
    return queue_->runWhile(condition, patience);
  }
  bool drain() override { return queue_->drain(); }
  [[nodiscard]] std::optional<int> descriptor() override { return queue_->descriptor(); }

 private:
  struct FirstRun;

  void watch();

  const std::unique_ptr<MainQueue> queue_;
  SystemLog& systemLog_;
  const std::chrono::milliseconds patience_;
  const std::shared_ptr<FirstRun> firstRun_;
  std::atomic<bool> isWatched_ = false;
};

}  // namespace Varnel::Platform
