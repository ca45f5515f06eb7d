// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>

#include <csignal>
#include <cstdlib>

#include <Tests/Programs/ScanFolder.h>
#include <orvane/Console.h>
#include <orvane/Interruption.h>
#include <orvane/ScanLog.h>

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

TEST(ScanLog, NamesTheFirstOfManyFilesAndCountsTheOthers) {
  const ScanFolder home;
  ::setenv("HOME", home.path().c_str(), 1);
  const Loss denied{Loss::Kind::unreadable, std::make_error_code(std::errc::permission_denied)};
  const auto complaints = [&](int count) {
    ScanLog log;
    for (int i = 0; i < count; ++i) log.fileLeftOut("/file" + std::to_string(i), denied);
    Console console;
    ::testing::internal::CaptureStderr();
    log.complain(console);
    return ::testing::internal::GetCapturedStderr();
  };
  EXPECT_EQ(complaints(0), "");
  EXPECT_EQ(complaints(1), "orvane: left out \"/file0\": it cannot be read: Permission denied\n");
  EXPECT_THAT(complaints(3), ::testing::Not(::testing::HasSubstr("more")));
  EXPECT_THAT(complaints(300),
              ::testing::EndsWith("orvane: 297 more were left out; the log names them all\n"));
}

}  // namespace
}  // namespace Orvane::Testing
