// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Ports/WallClockTimer.h>

#include <sys/timerfd.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstdint>
#include <optional>
#include <system_error>
#include <utility>

#include <Varnel/Platform/Linux/Adapters.h>
#include <Varnel/Platform/Linux/MainLoop/MainLoopSource.h>
#include <Varnel/Platform/POSIX/FileDescriptor.h>
#include <Varnel/Platform/Ports/SystemLog.h>

namespace Varnel::Platform::Linux {
namespace {

using std::chrono::seconds;

// The kernel's clock ends in 2262.
constexpr Date latest = std::chrono::sys_days(std::chrono::year(2200) / std::chrono::January / 1);
constexpr Date earliest = Date() + seconds(1);

itimerspec settingOf(Date date) {
  const auto time = std::clamp(date, earliest, latest).time_since_epoch();
  const auto whole = std::chrono::floor<seconds>(time);
  itimerspec setting{};
  setting.it_value.tv_sec = whole.count();
  setting.it_value.tv_nsec = std::chrono::nanoseconds(time - whole).count();
  return setting;
}

// The kernel's timer on the wall clock: it also expires when the machine wakes up after its time,
// and is cancelled when somebody sets the clock.
class DescriptorTimer final : public WallClockTimer {
 public:
  explicit DescriptorTimer(SystemLog& systemLog) : systemLog_(systemLog) {}

  void setHandler(std::function<void()> handler) override { handler_ = std::move(handler); }

  void arm(Date date) override {
    if (!connect()) return;
    const itimerspec setting = settingOf(date);
    isArmed_ = true;
    // If the clock was set since the last call, it fails with ECANCELED and has armed the timer all
    // the same.
    if (::timerfd_settime(descriptor_.get(), TFD_TIMER_ABSTIME | TFD_TIMER_CANCEL_ON_SET, &setting,
                          nullptr) != 0 &&
        errno != ECANCELED)
      report();
  }

  void disarm() override {
    isArmed_ = false;
    if (!descriptor_) return;
    const itimerspec none{};
    ::timerfd_settime(descriptor_.get(), 0, &none, nullptr);
  }

 private:
  bool connect() {
    if (descriptor_) return true;
    descriptor_ =
        POSIX::FileDescriptor(::timerfd_create(CLOCK_REALTIME, TFD_NONBLOCK | TFD_CLOEXEC));
    if (!descriptor_) {
      report();
      return false;
    }
    source_.emplace(descriptor_.get(), [this] { expired(); });
    return true;
  }

  void expired() {
    std::uint64_t count = 0;
    const bool hasExpired = ::read(descriptor_.get(), &count, sizeof count) > 0;
    if (!hasExpired && errno != ECANCELED) return;
    if (!std::exchange(isArmed_, false) || !handler_) return;
    const auto handler = handler_;
    handler();
  }

  void report() {
    systemLog_.write("Cannot wait for the time of notifications: " +
                     std::generic_category().message(errno));
  }

  SystemLog& systemLog_;
  std::function<void()> handler_;
  POSIX::FileDescriptor descriptor_;
  std::optional<MainLoopSource> source_;
  bool isArmed_ = false;
};

}  // namespace

std::unique_ptr<WallClockTimer> makeWallClockTimer(SystemLog& systemLog) {
  return std::make_unique<DescriptorTimer>(systemLog);
}

}  // namespace Varnel::Platform::Linux
