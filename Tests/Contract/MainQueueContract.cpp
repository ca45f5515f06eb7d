// SPDX-License-Identifier: MIT
#include <Tests/Contract/MainLoopWorlds.h>

#include <gmock/gmock.h>

#include <algorithm>
#include <array>
#include <chrono>
#include <thread>
#include <vector>

#include <Tests/Support/DrainUntil.h>
#include <Varnel/Platform/Testing/FakeMainQueue.h>

namespace Varnel::Platform::Contract {
namespace {

using ::testing::ElementsAre;

TEST_P(MainQueueContract, RunsBlocksLaterAndInOrderAlsoThoseThatBlocksPost) {
  MainQueue& queue = world->queue();
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
  MainQueue& queue = world->queue();
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
  MainQueue& queue = world->queue();
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
}

TEST_P(MainQueueContract, RunsWhileAConditionHolds) {
  MainQueue& queue = world->queue();
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
  MainQueue& queue = world->queue();
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

TEST_P(MainQueueContract, TwoStopsEndTwoRuns) {
  MainQueue& queue = world->queue();
  std::vector<int> ran;
  queue.post([&] {
    queue.stop();
    queue.stop();
    queue.run();
    ran.push_back(1);
  });
  queue.run();
  EXPECT_THAT(ran, ElementsAre(1));
}

TEST_P(MainQueueContract, WithoutPatienceWhatIsPostedStillRuns) {
  MainQueue& queue = world->queue();
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
  MainQueue& queue = world->queue();
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

  // Also when the post comes while the host is polling already.
  const int polled = descriptor();
  std::jthread poster([&] { queue.post([&] { ran = false; }); });
  EXPECT_TRUE(isReadable(polled, std::chrono::seconds(30)));
  EXPECT_TRUE(Tests::drainUntil(queue, [&] { return !ran; }));
}

class FakeWorld final : public MainQueueWorld {
 public:
  MainQueue& queue() override { return queue_; }

 private:
  Testing::FakeMainQueue queue_;
};

INSTANTIATE_TEST_SUITE_P(Fake, MainQueueContract, MainQueueContract::on<FakeWorld>());

}  // namespace
}  // namespace Varnel::Platform::Contract
