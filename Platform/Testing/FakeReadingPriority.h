// SPDX-License-Identifier: MIT
#pragma once

#include <atomic>
#include <map>

#include <Varnel/Platform/Ports/ReadingPriority.h>

namespace Varnel::Platform::Testing {

/// Remembers which threads have lowered their reading. Any thread.
///
///     FakeReadingPriority priority;
///     …
///     EXPECT_TRUE(priority.isLowered());  // this thread's
class FakeReadingPriority final : public ReadingPriority {
 public:
  [[nodiscard]] bool isLowered() const { return levelOfThread() == 1; }

  std::optional<Level> current() override { return levelOfThread(); }
  std::optional<Level> ofMainThread() override { return 0; }
  void set(Level level) override { levelOfThread() = level; }
  Level lowered(Level) override { return 1; }

 private:
  // The thread takes it along when it ends, so that a later one of the same number begins anew.
  Level& levelOfThread() const {
    static thread_local std::map<int, Level> levels;
    return levels[number_];
  }

  static inline std::atomic<int> fakes_ = 0;
  const int number_ = fakes_++;
};

}  // namespace Varnel::Platform::Testing
