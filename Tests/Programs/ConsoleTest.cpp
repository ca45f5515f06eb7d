// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>

#include <chrono>
#include <csignal>
#include <cstdlib>

#include <Tests/Programs/ScanFolder.h>
#include <orvane/Console.h>
#include <orvane/Interruption.h>
#include <orvane/ProgressLine.h>
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

TEST(Interruption, LeavesNoLineOfProgress) {
  const auto endWithALine = [] {
    std::atomic<bool> flag{false};
    const Interruption interruption(flag);
    Console console;
    console.showStatus("Looking: 1 file");
    std::raise(SIGHUP);
    std::raise(SIGTERM);
  };
  EXPECT_EXIT(endWithALine(), ::testing::KilledBySignal(SIGTERM), "Looking: 1 file\r\x1b\\[K$");
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

TEST(ProgressLine, SaysWhatHasRoom) {
  const struct {
    std::uint64_t found, toRead, read, bytes;
    int milliseconds;
    std::size_t columns;
    const char* text;
  } cases[] = {
      {0, 0, 0, 0, 0, 79, "Looking: 0 files"},
      {1, 0, 0, 0, 0, 79, "Looking: 1 file"},
      {1, 0, 0, 0, 0, 5, "Looki"},
      {9, 1, 0, 0, 0, 79, "Reading: 0 of 1 file, 0 MB"},
      {9, 0, 2, 0, 0, 79, "Looking: 9 files"},
      {9, 4, 2, 6'000'000, 999, 79, "Reading: 2 of 4 files, 6 MB"},
      {9, 4, 2, 6'000'000, 2000, 79, "Reading: 2 of 4 files, 6 MB, 3 MB/s, 2 s left"},
      {9, 4, 2, 6'000'000, 2000, 39, "Reading: 2 of 4 files, 6 MB, 3 MB/s"},
      {9, 4, 2, 6'000'000, 2000, 26, "Reading: 2 of 4 files"},
      {9, 4, 0, 6'000'000, 2000, 79, "Reading: 0 of 4 files, 6 MB, 3 MB/s"},
      {9, 101, 1, 0, 6'000, 199, "Reading: 1 of 101 files, 0 MB, 0 MB/s, 10 min left"},
      {9, 10'001, 1, 0, 6'000, 199, "Reading: 1 of 10001 files, 0 MB, 0 MB/s, 16 h left"},
      {9, 4, 5, 0, 2000, 79, "Reading: 4 of 4 files, 0 MB, 0 MB/s, 0 s left"},
  };
  for (const auto& each : cases) {
    ScanControl control;
    control.filesFound = each.found;
    control.filesToRead = each.toRead;
    control.filesRead = each.read;
    control.bytesRead = each.bytes;
    const std::chrono::milliseconds time(each.milliseconds);
    EXPECT_EQ(ProgressLine::text(control, time, each.columns), each.text);
  }
}

TEST(ScanLog, NamesTheFirstOfManyFilesAndCountsTheOthers) {
  const ScanFolder home;
  ::setenv("HOME", home.path().c_str(), 1);
  const Loss denied{Loss::Kind::unreadable, std::make_error_code(std::errc::permission_denied)};
  const auto complaints = [&](int count) {
    Console console;
    ScanLog log(console);
    for (int i = 0; i < count; ++i) log.fileLeftOut("/file" + std::to_string(i), denied);
    ::testing::internal::CaptureStderr();
    log.complain();
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
