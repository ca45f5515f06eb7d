// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>

#include <csignal>

#include <orvane/Interruption.h>

namespace Orvane::Testing {
namespace {

TEST(Interruption, TheFirstSignalAsksAndTheSecondEnds) {
  std::atomic<bool> flag{false};
  {
    const Interruption interruption(flag);
    EXPECT_EQ(interruption.signal(), 0);
    std::raise(SIGINT);
    EXPECT_TRUE(flag);
    EXPECT_EQ(interruption.signal(), SIGINT);
    EXPECT_EXIT(std::raise(SIGINT), ::testing::KilledBySignal(SIGINT), "");
  }
  EXPECT_EXIT(std::raise(SIGTERM), ::testing::KilledBySignal(SIGTERM), "");
}

TEST(Interruption, WhatWasIgnoredStaysIgnored) {
  (void)std::signal(SIGINT, SIG_IGN);
  std::atomic<bool> flag{false};
  {
    const Interruption interruption(flag);
    std::raise(SIGINT);
  }
  std::raise(SIGINT);
  EXPECT_FALSE(flag);
  (void)std::signal(SIGINT, SIG_DFL);
}

}  // namespace
}  // namespace Orvane::Testing
