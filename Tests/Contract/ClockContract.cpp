// SPDX-License-Identifier: MIT
#include <Tests/Contract/MainLoopWorlds.h>

#include <atomic>
#include <thread>
#include <vector>

#include <Varnel/Platform/Testing/SimulatedClock.h>

namespace Varnel::Platform::Contract {
namespace {

TEST_P(ClockContract, RunsForwardForEveryThread) {
  const Clock& clock = world->clock();
  std::atomic<bool> isOver = false;
  std::vector<std::jthread> readers;
  for (int i = 0; i < 2; ++i)
    readers.emplace_back([&] {
      for (Date last = clock.now(); !isOver;) {
        const Date now = clock.now();
        ASSERT_LE(last, now);
        last = now;
      }
    });
  const Date start = clock.now();
  for (int i = 0; i < 100; ++i) world->pass();
  EXPECT_LT(start, clock.now());
  isOver = true;
}

class FakeWorld final : public ClockWorld {
 public:
  Clock& clock() override { return clock_; }
  void pass() override { clock_.advance(std::chrono::seconds(1)); }

 private:
  Testing::SimulatedClock clock_;
};

INSTANTIATE_TEST_SUITE_P(Fake, ClockContract, ClockContract::on<FakeWorld>());

}  // namespace
}  // namespace Varnel::Platform::Contract
