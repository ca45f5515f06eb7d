// SPDX-License-Identifier: MIT
#include <Tests/Contract/MainLoopWorlds.h>

#include <gmock/gmock.h>

#include <string>
#include <vector>

#include <Varnel/Platform/Testing/FakeWallClockTimer.h>

namespace Varnel::Platform::Contract {
namespace {

using namespace std::chrono_literals;

TEST_P(WallClockTimerContract, CallsOnceAtTheDateAndNeverWithinTheArming) {
  const auto timer = world->timer();
  int calls = 0;
  Date date;
  timer->setHandler([&] {
    ++calls;
    EXPECT_GE(world->now(), date);
  });
  for (const auto distance : {20ms, 0ms, -1ms}) {
    calls = 0;
    date = world->now() + distance;
    timer->arm(date);
    EXPECT_EQ(calls, 0) << distance.count();
    world->passUntil([&] { return calls > 0; });
    EXPECT_EQ(calls, 1) << distance.count();
  }
  date = Date::min();
  timer->arm(date);
  EXPECT_EQ(calls, 1);
  world->passUntil([&] { return calls > 1; });
}

// What must not be heard is shown by a second timer, which was armed later and is heard.
TEST_P(WallClockTimerContract, OnlyTheLastArmingCountsAndNoneAfterADisarming) {
  const auto timer = world->timer();
  const auto later = world->timer();
  std::string heard;
  timer->setHandler([&] { heard += '1'; });
  later->setHandler([&] { heard += '2'; });
  const auto expect = [&](const char* expected) {
    heard.clear();
    const Date soon = world->now() + 2ms;
    later->arm(soon);
    world->passUntil([&] { return heard.find('2') != std::string::npos; });
    EXPECT_EQ(heard, expected);
  };
  // The date has come, but the main thread has not yet had the time to tell.
  timer->arm(world->now());
  timer->disarm();
  expect("2");
  timer->arm(world->now());
  timer->arm(Date::max());
  expect("2");
  timer->arm(Date::max());
  timer->arm(world->now());
  expect("12");
  expect("2");
  timer->disarm();

  // Without a handler the date passes, and the next handler does not hear of it.
  timer->setHandler(nullptr);
  timer->arm(world->now());
  expect("2");
  timer->setHandler([&] { heard += '1'; });
  expect("2");
}

TEST_P(WallClockTimerContract, AHandlerMayArmAgainAndPutAnotherInItsPlace) {
  const auto timer = world->timer();
  std::string heard;
  const std::string first = "first";
  timer->setHandler([&, first] {
    timer->arm(world->now());
    timer->setHandler([&] { heard += " second"; });
    heard += first;
  });
  timer->arm(world->now());
  world->passUntil([&] { return heard.ends_with("second"); });
  EXPECT_EQ(heard, "first second");
}

class FakeWorld final : public WallClockTimerWorld {
 public:
  std::unique_ptr<WallClockTimer> timer() override {
    auto timer = std::make_unique<Testing::FakeWallClockTimer>(clock_);
    timers_.push_back(timer.get());
    return timer;
  }
  Date now() override { return clock_.now(); }
  void passUntil(const std::function<bool()>& condition) override {
    while (!condition())
      for (const Date next = clock_.now() + 1ms; auto* timer : timers_) timer->advanceTo(next);
  }

 private:
  Testing::SimulatedClock clock_{std::chrono::sys_days(std::chrono::days(20'000))};
  std::vector<Testing::FakeWallClockTimer*> timers_;
};

INSTANTIATE_TEST_SUITE_P(Fake, WallClockTimerContract, WallClockTimerContract::on<FakeWorld>());

}  // namespace
}  // namespace Varnel::Platform::Contract
