// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Testing/FaultPlan.h>

#include <string>
#include <vector>

#include <Varnel/Platform/Testing/FakeWallClockTimer.h>
#include <Varnel/Platform/Testing/SimulatedClock.h>
#include <gtest/gtest.h>

namespace Varnel::Platform::Testing {
namespace {

using namespace std::chrono_literals;

TEST(FaultPlan, ADelayedTimerRingsLateAndAMissingOneNever) {
  for (const Fault fault : {Fault::delays, Fault::absent}) {
    SimulatedClock clock;
    const Date start = clock.now();
    FakeWallClockTimer timer(clock);
    timer.faults->plan(fault, 1);
    std::vector<Date> rang;
    timer.setHandler([&] { rang.push_back(clock.now()); });
    timer.arm(start + 1h);
    timer.advanceTo(start + 3h);
    EXPECT_EQ(rang, fault == Fault::delays ? std::vector{start + 3h} : std::vector<Date>());
  }
}

TEST(FaultPlan, ASweepMakesEachCallGoWrongOnce) {
  std::string struck;
  const auto calls = sweepFaults(Fault::fails, [&](const auto& faults) {
    for (const char call : {'1', '2', '3'})
      if (faults->next() == Fault::fails) struck += call;
  });
  EXPECT_EQ(calls, 3u);
  EXPECT_EQ(struck, "123");
}

}  // namespace
}  // namespace Varnel::Platform::Testing
