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
constexpr int bestEffort = 2;
constexpr int idle = 3;
constexpr int lastLevel = 7;
// Not the idle class: a reader that others starve would keep its place on the disk all the while,
// and with it the urgent readers of this process waiting.
constexpr int lastBestEffort = bestEffort << classShift | lastLevel;

constexpr long thisThread = 0;

class ThreadPriority final : public ReadingPriority {
 public:
  std::optional<Level> current() override {
    const long level = ::syscall(SYS_ioprio_get, whoThread, thisThread);
    return level < 0 ? std::nullopt : std::optional(static_cast<Level>(level));
  }

  void set(Level level) override { ::syscall(SYS_ioprio_set, whoThread, thisThread, level); }

  Level lowered(Level normal) override {
    return normal >> classShift == idle ? normal : lastBestEffort;
  }
};

}  // namespace

std::unique_ptr<ReadingPriority> makeReadingPriority() {
  return std::make_unique<ThreadPriority>();
}

}  // namespace Varnel::Platform::Linux
