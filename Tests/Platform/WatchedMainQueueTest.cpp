// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Generic/WatchedMainQueue.h>

#include <gmock/gmock.h>

#include <chrono>
#include <memory>
#include <semaphore>

#include <Varnel/Platform/Ports/SystemLog.h>
#include <Varnel/Platform/Testing/CapturedOutput.h>
#include <Varnel/Platform/Testing/FakeMainQueue.h>

namespace Varnel::Platform {
namespace {

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

}  // namespace
}  // namespace Varnel::Platform
