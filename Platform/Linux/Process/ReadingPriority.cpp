// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Ports/ReadingPriority.h>

#include <sys/syscall.h>
#include <unistd.h>

#include <Varnel/Platform/Linux/Adapters.h>

namespace Varnel::Platform::Linux {
namespace {

// The kernel tells these in a header of its own only since Linux 5.15.
constexpr int whoThread = 1;
constexpr int classShift = 13;
constexpr int none = 0;
constexpr int realTime = 1;
constexpr int bestEffort = 2;
constexpr int idle = 3;
constexpr int lastLevel = 7;
// Not the idle class: a reader that others starve would keep its place on the disk all the while,
// and with it the urgent readers of this process waiting.
constexpr int lastBestEffort = bestEffort << classShift | lastLevel;

constexpr long thisThread = 0;

// Before Linux 5.15 a thread that never set its level is told with one that cannot be set.
int settable(long level) {
  return level >> classShift == none ? 0 : static_cast<int>(level);
}

std::optional<ReadingPriority::Level> levelOf(long thread) {
  const long level = ::syscall(SYS_ioprio_get, whoThread, thread);
  return level < 0 ? std::nullopt : std::optional(settable(level));
}

class ThreadPriority final : public ReadingPriority {
 public:
  std::optional<Level> current() override { return levelOf(thisThread); }
  std::optional<Level> ofMainThread() override { return levelOf(::getpid()); }

  void set(Level level) override {
    ::syscall(SYS_ioprio_set, whoThread, thisThread, settable(level));
  }

  // An ordinary user's thread could not get back to the real-time class.
  Level lowered(Level normal) override {
    const int levelClass = normal >> classShift;
    return levelClass == idle || levelClass == realTime ? normal : lastBestEffort;
  }
};

}  // namespace

std::unique_ptr<ReadingPriority> makeReadingPriority() {
  return std::make_unique<ThreadPriority>();
}

}  // namespace Varnel::Platform::Linux
