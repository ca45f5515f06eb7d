// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>
#include <signal.h>
#include <unistd.h>

#include <chrono>
#include <cstdlib>
#include <thread>

#include <Tests/Programs/ScanFolder.h>
#include <orvane/Console.h>
#include <orvane/Interruption.h>
#include <orvane/ProgressLine.h>
#include <orvane/ScanLog.h>

namespace Orvane::Testing {
namespace {

void send(int signal) {
  EXPECT_EQ(::kill(::getpid(), signal), 0);
}

void ask(int signal, const std::atomic<bool>& flag) {
  send(signal);
  while (!flag) std::this_thread::yield();
}

// Not even when the main thread takes none, as one that waits for a share that does not answer.
TEST(Interruption, TheFirstSignalAsksAndTheSecondEndsAndLeavesNoLineOfProgress) {
  sigset_t all;
  ::sigfillset(&all);
  const auto endWithALine = [&] {
    ::pthread_sigmask(SIG_BLOCK, &all, nullptr);
    std::atomic<bool> flag{false};
    const Interruption interruption(flag);
    Console console;
    console.showStatus("Looking: 1 file");
    ask(SIGHUP, flag);
    send(SIGTERM);
    for (;;) ::pause();
  };
  EXPECT_EXIT(endWithALine(), ::testing::KilledBySignal(SIGTERM), "Looking: 1 file\r\x1b\\[K$");
  {
    std::atomic<bool> flag{false};
    const Interruption interruption(flag);
    EXPECT_EQ(interruption.signal(), 0);
    ask(SIGINT, flag);
    EXPECT_EQ(interruption.signal(), SIGINT);
  }
  EXPECT_EXIT(::raise(SIGTERM), ::testing::KilledBySignal(SIGTERM), "");
}

TEST(Interruption, WhatWasIgnoredStaysIgnored) {
  (void)::signal(SIGINT, SIG_IGN);
  std::atomic<bool> flag{false};
  {
    const Interruption interruption(flag);
    send(SIGINT);
  }
  send(SIGINT);
  EXPECT_FALSE(flag);
  (void)::signal(SIGINT, SIG_DFL);
}

TEST(ProgressLine, SaysWhatHasRoom) {
  const struct {
    std::uint64_t found, files, bytes, filesRead, bytesRead;
    int milliseconds;
    std::size_t columns;
    const char* text;
  } cases[] = {
      {0, 0, 0, 0, 0, 0, 79, "Looking: 0 files"},
      {1, 0, 0, 0, 0, 0, 79, "Looking: 1 file"},
      {1, 0, 0, 0, 0, 0, 5, "Looki"},
      {9, 0, 0, 2, 0, 0, 79, "Looking: 9 files"},
      {9, 1, 900, 0, 0, 2000, 79, "Reading: 0 of 0 MB, 0 of 1 file"},
      {9, 4, 9'000'000, 2, 6'000'000, 999, 79, "Reading: 6 of 9 MB, 2 of 4 files"},
      {9, 4, 9'000'000, 2, 6'000'000, 2000, 79,
       "Reading: 6 of 9 MB, 1 s left, 3 MB/s, 2 of 4 files"},
      {9, 4, 9'000'000, 2, 6'000'000, 2000, 39, "Reading: 6 of 9 MB, 1 s left, 3 MB/s"},
      {9, 4, 9'000'000, 2, 6'000'000, 2000, 31, "Reading: 6 of 9 MB, 1 s left"},
      // A few large files after many small ones.
      {9, 1000, 7'000'000'000, 999, 1'000'000, 1000, 49, "Reading: 1 of 7000 MB, 1 h left, 1 MB/s"},
      {9, 9, 60'001'000'000, 1, 1'000'000, 6'000, 199,
       "Reading: 1 of 60001 MB, 100 h left, 0 MB/s, 1 of 9 files"},
      {9, 4, 6'000'000, 5, 7'000'000, 2000, 79,
       "Reading: 6 of 6 MB, 0 s left, 3 MB/s, 4 of 4 files"},
  };
  for (const auto& each : cases) {
    ScanControl control;
    control.filesFound = each.found;
    control.filesToRead = each.files;
    control.bytesToRead = each.bytes;
    control.filesRead = each.filesRead;
    control.bytesRead = each.bytesRead;
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
