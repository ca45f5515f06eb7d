// SPDX-License-Identifier: MIT
#pragma once

#include <functional>
#include <memory>
#include <thread>

namespace Varnel::Platform {
class MainQueue;
}

namespace Orvane {

/// Does work behind the main thread, and goes on there.
class Background {
 public:
  using Continuation = std::function<void()>;
  /// Runs on another thread; what it returns runs on the main one. Neither may throw.
  using Job = std::function<Continuation()>;

  virtual ~Background() = default;

  /// Begins a job, when the one before has ended. Main thread only.
  virtual void start(Job job) = 0;
};

/// Each job has a thread of its own. Destroying it waits for the job, whose continuation is then
/// dropped.
class ThreadBackground final : public Background {
 public:
  explicit ThreadBackground(Varnel::Platform::MainQueue& mainQueue);
  ~ThreadBackground() override;
  ThreadBackground(const ThreadBackground&) = delete;
  ThreadBackground& operator=(const ThreadBackground&) = delete;

  void start(Job job) override;

 private:
  Varnel::Platform::MainQueue& mainQueue_;
  const std::shared_ptr<bool> lifetime_ = std::make_shared<bool>();
  std::thread thread_;
};

}  // namespace Orvane
