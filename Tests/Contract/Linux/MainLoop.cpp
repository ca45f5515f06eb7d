// SPDX-License-Identifier: MIT
#include <Tests/Contract/MainLoopWorlds.h>

#include <signal.h>
#include <stdlib.h>

#include <string_view>
#include <vector>

#include <Varnel/Platform/Linux/Adapters.h>
#include <Varnel/Platform/Ports/MainQueue.h>
#include <Varnel/Platform/Testing/CapturedOutput.h>

namespace Varnel::Platform::Contract {
namespace {

using namespace std::string_view_literals;

// Of the calling thread.
std::vector<int> blockedSignals() {
  sigset_t blocked;
  ::pthread_sigmask(SIG_BLOCK, nullptr, &blocked);
  std::vector<int> signals;
  for (int signal = 1; signal <= SIGRTMAX; ++signal)
    if (::sigismember(&blocked, signal) == 1) signals.push_back(signal);
  return signals;
}

class LinuxWorld final : public SoundPlayerWorld {
 public:
  LinuxWorld() {
    ::setenv("GST_REGISTRY", VARNEL_GSTREAMER_REGISTRY, 1);
    // Whatever this machine has to play sounds on stays silent.
    ::setenv("PULSE_SERVER", "unix:/nonexistent", 1);
    ::setenv("PULSE_CLIENTCONFIG", "/dev/null", 1);
  }
  ~LinuxWorld() override {
    EXPECT_EQ(log_.text(), "");
    EXPECT_EQ(blockedSignals(), signals_) << "some sinks change those of the thread they are on";
  }
  SoundPlayer& port() override { return *player_; }
  // 400 samples of silence, 8000 a second.
  std::string sound() override {
    std::string bytes(
        "RIFF\xb4\1\0\0WAVEfmt \x10\0\0\0\1\0\1\0\x40\x1f\0\0\x40\x1f\0\0\1\0\x8\0"
        "data\x90\1\0\0"sv);
    return bytes.append(400, '\x80');
  }
  std::string damagedSound() override { return sound().substr(0, 12) + "no sound at all"; }
  std::string noSound() override { return "no sound at all"; }
  void playUntil(const std::function<bool()>& condition) override {
    const auto holds = [&] { return !condition(); };
    EXPECT_TRUE(queue_->runWhile(holds, std::chrono::seconds(60))) << log_.text();
  }

 private:
  const std::vector<int> signals_ = blockedSignals();
  const std::unique_ptr<MainQueue> queue_ = Linux::makeMainQueue();
  Testing::CapturedSystemLog log_;
  const std::unique_ptr<SoundPlayer> player_ = Linux::makeSoundPlayer(log_, *queue_);
};
INSTANTIATE_TEST_SUITE_P(Linux, SoundPlayerContract, on<LinuxWorld>());

class LinuxTimers final : public WallClockTimerWorld {
 public:
  std::unique_ptr<WallClockTimer> timer() override { return Linux::makeWallClockTimer(log_); }
  Date now() override {
    return std::chrono::floor<Date::duration>(std::chrono::system_clock::now());
  }
  void passUntil(const std::function<bool()>& condition) override {
    const auto holds = [&] { return !condition(); };
    EXPECT_TRUE(queue_->runWhile(holds, std::chrono::seconds(30))) << log_.text();
  }

 private:
  const std::unique_ptr<MainQueue> queue_ = Linux::makeMainQueue();
  Testing::CapturedSystemLog log_;
};
INSTANTIATE_TEST_SUITE_P(Linux, WallClockTimerContract, on<LinuxTimers>());

}  // namespace
}  // namespace Varnel::Platform::Contract
