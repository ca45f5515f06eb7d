// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Ports/MainQueue.h>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <array>
#include <chrono>
#include <memory>
#include <ostream>
#include <semaphore>
#include <thread>
#include <vector>

#include <Tests/Support/DrainUntil.h>
#include <Varnel/Platform/Generic/WatchedMainQueue.h>
#include <Varnel/Platform/Linux/Adapters.h>
#include <Varnel/Platform/Ports/SystemLog.h>
#include <Varnel/Platform/Testing/CapturedOutput.h>
#include <Varnel/Platform/Testing/FakeMainQueue.h>

namespace Varnel::Platform {
namespace {

using ::testing::ElementsAre;

struct Adapter {
  const char* name;
  std::unique_ptr<MainQueue> (*make)();

  friend void PrintTo(const Adapter& adapter, std::ostream* stream) { *stream << adapter.name; }
};

class MainQueueContract : public ::testing::TestWithParam<Adapter> {
 protected:
  const std::unique_ptr<MainQueue> queue = GetParam().make();
};

TEST_P(MainQueueContract, RunsBlocksLaterAndInOrderAlsoThoseThatBlocksPost) {
  std::vector<int> ran;
  queue->post([&] {
    ran.push_back(1);
    queue->post([&] { ran.push_back(3); });
    EXPECT_EQ(ran.size(), 1u) << "posting from the main thread must not run the block at once";
  });
  queue->post([&] { ran.push_back(2); });
  EXPECT_TRUE(ran.empty());
  EXPECT_TRUE(queue->drain());
  EXPECT_THAT(ran, ElementsAre(1, 2, 3));
  EXPECT_FALSE(queue->drain());
}

TEST_P(MainQueueContract, ABlockThatDrainsRunsWhatWasPostedBehindIt) {
  std::vector<int> ran;
  queue->post([&] {
    queue->drain();
    ran.push_back(1);
  });
  queue->post([&] { ran.push_back(2); });
  queue->drain();
  EXPECT_THAT(ran, ElementsAre(2, 1));
}

TEST_P(MainQueueContract, StopEndsTheInnermostRunBehindWhatWasPostedBefore) {
  std::vector<int> ran;
  queue->post([&] {
    queue->stop();
    queue->run();
    ran.push_back(1);
  });
  queue->post([&] {
    ran.push_back(2);
    queue->stop();
  });
  queue->run();
  EXPECT_THAT(ran, ElementsAre(2, 1));
  queue->stop();
  queue->drain();
  queue->run();
}

TEST_P(MainQueueContract, RunsWhileAConditionHolds) {
  int left = 3;
  for (int i = 0; i < 5; ++i) queue->post([&] { --left; });
  queue->runWhile([&] { return left > 0; });
  EXPECT_LE(left, 0);
  queue->drain();
  EXPECT_EQ(left, -2);

  // And not for ever, though nothing comes.
  const auto holds = [] { return true; };
  EXPECT_FALSE(queue->runWhile(holds, std::chrono::milliseconds(1)));
  queue->post([&] { left = 7; });
  EXPECT_TRUE(queue->runWhile([&] { return left < 7; }, std::chrono::minutes(5)));
}

TEST_P(MainQueueContract, TakesBlocksOfManyThreadsEachInItsOrder) {
  constexpr int threadCount = 4;
  constexpr int blockCount = 2000;
  std::array<std::vector<int>, threadCount> ran;
  int finished = 0;
  const auto postAll = [&](std::vector<int>& mine) {
    EXPECT_FALSE(queue->isCurrent());
    for (int i = 0; i < blockCount; ++i) queue->post([&mine, i] { mine.push_back(i); });
    queue->post([&] {
      EXPECT_TRUE(queue->isCurrent());
      if (++finished == threadCount) queue->stop();
    });
  };
  std::vector<std::jthread> threads;
  for (auto& mine : ran) threads.emplace_back([&] { postAll(mine); });
  queue->run();
  for (const auto& mine : ran) {
    EXPECT_EQ(mine.size(), static_cast<std::size_t>(blockCount));
    EXPECT_TRUE(std::is_sorted(mine.begin(), mine.end()));
  }
}

// The fake has none: nothing in a test polls.
TEST(LinuxMainQueue, DescriptorWakesAHostThatPolls) {
  const std::unique_ptr<MainQueue> queue = Linux::makeMainQueue();
  ASSERT_TRUE(queue->descriptor());
  queue->drain();
  EXPECT_FALSE(Tests::isReadable(*queue->descriptor(), std::chrono::seconds(0)));
  bool ran = false;
  queue->post([&] { ran = true; });
  EXPECT_TRUE(Tests::isReadable(*queue->descriptor(), std::chrono::seconds(0)));
  queue->drain();
  EXPECT_TRUE(ran);
  EXPECT_FALSE(Tests::isReadable(*queue->descriptor(), std::chrono::seconds(0)));

  // Also when the post comes while the host is polling already.
  const int descriptor = *queue->descriptor();
  std::jthread poster([&] { queue->post([&] { ran = false; }); });
  EXPECT_TRUE(Tests::isReadable(descriptor, std::chrono::seconds(30)));
  EXPECT_TRUE(Tests::drainUntil(*queue, [&] { return !ran; }));
}

TEST(WatchedMainQueue, SaysOnceThatNobodyRunsIt) {
  Testing::CapturedSystemLog log;
  {
    WatchedMainQueue healthy(std::make_unique<Testing::FakeMainQueue>(), log,
                             std::chrono::minutes(10));
    healthy.post([] {});
    EXPECT_TRUE(healthy.drain());
    healthy.post([] {});
    // One that goes before it has run keeps nobody waiting.
    WatchedMainQueue(std::make_unique<Testing::FakeMainQueue>(), log, std::chrono::minutes(10))
        .post([] {});
  }
  EXPECT_EQ(log.text(), "");

  // A line that is awaited: nothing else tells that the watch has ended.
  struct Line final : SystemLog {
    void write(std::string_view text) override {
      EXPECT_THAT(std::string(text), ::testing::HasSubstr("main queue"));
      written.release();
    }
    std::counting_semaphore<> written{0};
  } line;
  WatchedMainQueue stalled(std::make_unique<Testing::FakeMainQueue>(), line,
                           std::chrono::milliseconds(1));
  for (int i = 0; i < 3; ++i) stalled.post([] {});
  EXPECT_TRUE(line.written.try_acquire_for(std::chrono::seconds(30)));
  stalled.drain();
  stalled.post([] {});
  EXPECT_FALSE(line.written.try_acquire());
}

INSTANTIATE_TEST_SUITE_P(
    , MainQueueContract,
    ::testing::Values(Adapter{"Fake",
                              []() -> std::unique_ptr<MainQueue> {
                                return std::make_unique<Testing::FakeMainQueue>();
                              }},
                      Adapter{"System", &Linux::makeMainQueue},
                      Adapter{"Watched",
                              []() -> std::unique_ptr<MainQueue> {
                                static Testing::CapturedSystemLog log;
                                return std::make_unique<WatchedMainQueue>(Linux::makeMainQueue(),
                                                                          log);
                              }}),
    [](const auto& instance) { return instance.param.name; });

}  // namespace
}  // namespace Varnel::Platform
