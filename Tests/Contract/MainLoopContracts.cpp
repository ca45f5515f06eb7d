// SPDX-License-Identifier: MIT
#include <Tests/Contract/MainLoopWorlds.h>

#include <gmock/gmock.h>

#include <algorithm>
#include <array>
#include <atomic>
#include <chrono>
#include <string>
#include <thread>
#include <vector>

#include <Tests/Support/DrainUntil.h>
#include <Varnel/Platform/Testing/FakeApplication.h>
#include <Varnel/Platform/Testing/FakeMainQueue.h>
#include <Varnel/Platform/Testing/FakeWallClockTimer.h>
#include <Varnel/Platform/Testing/SimulatedClock.h>

namespace Varnel::Platform::Contract {
namespace {

using namespace std::chrono_literals;
using ::testing::ElementsAre;

TEST_P(ApplicationContract, IsInFrontWhenTheHostSaysSoOnWhateverThread) {
  auto& application = world->port();
  EXPECT_FALSE(application.isActive());
  for (const bool isActive : {true, true, false, false}) {
    std::jthread([&] { application.setActive(isActive); }).join();
    EXPECT_EQ(application.isActive(), isActive);
  }
}

INSTANTIATE_TEST_SUITE_P(Fake, ApplicationContract, on<Testing::FakeApplication>());

TEST_P(ClockContract, RunsForwardForEveryThread) {
  const Clock& clock = world->port();
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

class FakeClockWorld final : public FakeColumn<ClockWorld, Testing::SimulatedClock> {
 public:
  void pass() override { port_.advance(std::chrono::seconds(1)); }
};
INSTANTIATE_TEST_SUITE_P(Fake, ClockContract, on<FakeClockWorld>());

TEST_P(MainQueueContract, RunsBlocksLaterAndInOrderAlsoThoseThatBlocksPost) {
  MainQueue& queue = world->port();
  std::vector<int> ran;
  queue.post([&] {
    ran.push_back(1);
    queue.post([&] { ran.push_back(3); });
    EXPECT_EQ(ran.size(), 1u) << "posting from the main thread must not run the block at once";
  });
  queue.post([&] { ran.push_back(2); });
  EXPECT_TRUE(ran.empty());
  EXPECT_TRUE(queue.drain());
  EXPECT_THAT(ran, ElementsAre(1, 2, 3));
  EXPECT_FALSE(queue.drain());
}

TEST_P(MainQueueContract, ABlockThatDrainsRunsWhatWasPostedBehindIt) {
  MainQueue& queue = world->port();
  std::vector<int> ran;
  queue.post([&] {
    queue.drain();
    ran.push_back(1);
  });
  queue.post([&] { ran.push_back(2); });
  queue.drain();
  EXPECT_THAT(ran, ElementsAre(2, 1));
}

TEST_P(MainQueueContract, StopEndsTheInnermostRunBehindWhatWasPostedBefore) {
  MainQueue& queue = world->port();
  std::vector<int> ran;
  queue.post([&] {
    queue.stop();
    queue.run();
    ran.push_back(1);
  });
  queue.post([&] {
    ran.push_back(2);
    queue.stop();
  });
  queue.run();
  EXPECT_THAT(ran, ElementsAre(2, 1));
  queue.stop();
  queue.drain();
  queue.run();

  // Two stops end two runs.
  queue.post([&] {
    for (int i = 0; i < 2; ++i) queue.stop();
    queue.run();
    ran.push_back(3);
  });
  queue.run();
  EXPECT_THAT(ran, ElementsAre(2, 1, 3));
  // Also those that were called while no run was under way.
  for (int i = 0; i < 3; ++i) queue.stop();
  queue.drain();
  for (int i = 0; i < 3; ++i) queue.run();
}

TEST_P(MainQueueContract, RunsWhileAConditionHolds) {
  MainQueue& queue = world->port();
  int left = 3;
  for (int i = 0; i < 5; ++i) queue.post([&] { --left; });
  queue.runWhile([&] { return left > 0; });
  EXPECT_LE(left, 0);
  queue.drain();
  EXPECT_EQ(left, -2);

  // And not for ever, though nothing comes.
  const auto holds = [] { return true; };
  EXPECT_FALSE(queue.runWhile(holds, std::chrono::milliseconds(1)));
  queue.post([&] { left = 7; });
  EXPECT_TRUE(queue.runWhile([&] { return left < 7; }, std::chrono::minutes(5)));
}

TEST_P(MainQueueContract, TakesBlocksOfManyThreadsEachInItsOrder) {
  MainQueue& queue = world->port();
  constexpr int threadCount = 4;
  constexpr int blockCount = 2000;
  std::array<std::vector<int>, threadCount> ran;
  int finished = 0;
  const auto postAll = [&](std::vector<int>& mine) {
    EXPECT_FALSE(queue.isCurrent());
    for (int i = 0; i < blockCount; ++i) queue.post([&mine, i] { mine.push_back(i); });
    queue.post([&] {
      EXPECT_TRUE(queue.isCurrent());
      if (++finished == threadCount) queue.stop();
    });
  };
  std::vector<std::jthread> threads;
  for (auto& mine : ran) threads.emplace_back([&] { postAll(mine); });
  queue.run();
  for (const auto& mine : ran) {
    EXPECT_EQ(mine.size(), static_cast<std::size_t>(blockCount));
    EXPECT_TRUE(std::is_sorted(mine.begin(), mine.end()));
  }
}

TEST_P(MainQueueContract, WithoutPatienceWhatIsPostedStillRuns) {
  MainQueue& queue = world->port();
  for (const auto patience : {std::chrono::milliseconds(0), std::chrono::milliseconds(-1)}) {
    bool holds = true;
    EXPECT_FALSE(queue.runWhile([&] { return holds; }, patience));
    queue.post([] {});
    queue.post([&] { holds = false; });
    EXPECT_TRUE(queue.runWhile([&] { return holds; }, patience)) << patience.count();
  }
  bool holds = true;
  queue.post([&] { holds = false; });
  EXPECT_TRUE(queue.runWhile([&] { return holds; }, std::chrono::milliseconds::max()));
}

TEST_P(MainQueueContract, TheDescriptorWakesAHostThatPolls) {
  using Tests::isReadable;
  MainQueue& queue = world->port();
  const auto descriptor = [&] { return queue.descriptor().value(); };
  if (!queue.descriptor()) GTEST_SKIP() << "The system has none.";
  queue.drain();
  EXPECT_FALSE(isReadable(descriptor(), std::chrono::seconds(0)));
  bool ran = false;
  queue.post([&] { ran = true; });
  EXPECT_TRUE(isReadable(descriptor(), std::chrono::seconds(0)));
  queue.drain();
  EXPECT_TRUE(ran);
  EXPECT_FALSE(isReadable(descriptor(), std::chrono::seconds(0)));

  int left = 2;
  for (int i = 0; i < 2; ++i) queue.post([&] { --left; });
  queue.runWhile([&] { return left == 2; });
  EXPECT_EQ(isReadable(descriptor(), std::chrono::seconds(0)), left > 0) << "what has not run yet";
  queue.drain();

  // Also when the post comes while the host is polling already.
  const int polled = descriptor();
  std::jthread poster([&] { queue.post([&] { ran = false; }); });
  EXPECT_TRUE(isReadable(polled, std::chrono::seconds(30)));
  EXPECT_TRUE(Tests::drainUntil(queue, [&] { return !ran; }));
}

INSTANTIATE_TEST_SUITE_P(Fake, MainQueueContract, on<Testing::FakeMainQueue>());

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

class FakeTimers final : public WallClockTimerWorld {
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
INSTANTIATE_TEST_SUITE_P(Fake, WallClockTimerContract, on<FakeTimers>());

}  // namespace
}  // namespace Varnel::Platform::Contract
