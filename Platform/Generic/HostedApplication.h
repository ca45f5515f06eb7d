// SPDX-License-Identifier: MIT
#pragma once

#include <atomic>
#include <functional>
#include <mutex>
#include <utility>

#include <Varnel/Platform/Ports/Application.h>

namespace Varnel::Platform {

/// An application whose host alone knows whether it is in front. Any thread.
class HostedApplication final : public Application {
 public:
  using Observer = std::function<void(bool isActive)>;

  [[nodiscard]] bool isActive() const override { return isActive_; }
  void setActive(bool isActive) override {
    const std::lock_guard lock(mutex_);
    if (isActive_.exchange(isActive) != isActive && observer_) observer_(isActive);
  }

  /// Is told at once how things stand, and of each change, on the thread that makes it. It must not
  /// call back.
  void setObserver(Observer observer) {
    const std::lock_guard lock(mutex_);
    observer_ = std::move(observer);
    if (observer_) observer_(isActive_);
  }

 private:
  std::mutex mutex_;  ///< Owns the observer, and keeps what it is told in order.
  Observer observer_;
  std::atomic<bool> isActive_ = false;
};

}  // namespace Varnel::Platform
