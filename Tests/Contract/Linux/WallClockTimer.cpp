// SPDX-License-Identifier: MIT
#include <Tests/Contract/MainLoopWorlds.h>
#include <Varnel/Platform/Linux/Adapters.h>
#include <Varnel/Platform/Ports/MainQueue.h>
#include <Varnel/Platform/Testing/CapturedOutput.h>

namespace Varnel::Platform::Contract {
namespace {

class LinuxWorld final : public WallClockTimerWorld {
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

INSTANTIATE_TEST_SUITE_P(Linux, WallClockTimerContract, WallClockTimerContract::on<LinuxWorld>());

}  // namespace
}  // namespace Varnel::Platform::Contract
