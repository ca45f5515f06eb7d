// SPDX-License-Identifier: MIT
#pragma once

#include <map>
#include <mutex>
#include <thread>

#include <Varnel/Platform/Ports/ReadingPriority.h>

namespace Varnel::Platform::Testing {

/// Remembers which threads have lowered their reading. Any thread.
///
///     FakeReadingPriority priority;
///     …
///     EXPECT_TRUE(priority.isLowered());  // this thread's
class FakeReadingPriority final : public ReadingPriority {
 public:
  [[nodiscard]] bool isLowered() const {
    const std::lock_guard lock(mutex_);
    const auto found = levels_.find(std::this_thread::get_id());
    return found != levels_.end() && found->second == 1;
  }

  std::optional<Level> current() override { return isLowered() ? 1 : 0; }
  std::optional<Level> ofMainThread() override { return 0; }

  void set(Level level) override {
    const std::lock_guard lock(mutex_);
    levels_[std::this_thread::get_id()] = level;
  }

  Level lowered(Level) override { return 1; }

 private:
  mutable std::mutex mutex_;  ///< Owns the rest.
  std::map<std::thread::id, Level> levels_;
};

}  // namespace Varnel::Platform::Testing
