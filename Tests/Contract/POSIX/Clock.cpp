// SPDX-License-Identifier: MIT
#include <Tests/Contract/MainLoopWorlds.h>

#include <time.h>

#include <Varnel/Platform/POSIX/Adapters.h>

namespace Varnel::Platform::Contract {
namespace {

class POSIXWorld final : public ClockWorld {
 public:
  Clock& clock() override { return *clock_; }
  void pass() override {
    const Date before = clock_->now();
    while (clock_->now() == before) continue;
    EXPECT_LE(std::abs(std::chrono::system_clock::to_time_t(clock_->now()) - ::time(nullptr)), 60);
  }

 private:
  const std::unique_ptr<Clock> clock_ = POSIX::makeClock();
};

INSTANTIATE_TEST_SUITE_P(POSIX, ClockContract, ClockContract::on<POSIXWorld>());

}  // namespace
}  // namespace Varnel::Platform::Contract
