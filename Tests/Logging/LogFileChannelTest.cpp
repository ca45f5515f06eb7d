// SPDX-License-Identifier: MIT
#include <Varnel/Logging/LogFileChannel.h>

#include <gtest/gtest.h>
#include <sys/syscall.h>

#include <filesystem>
#include <fstream>
#include <thread>

#include <Tests/Support/ForbiddenCalls.h>
#include <Varnel/Platform/Testing/CapturedOutput.h>
#include <Varnel/Platform/Testing/FakeAppendFiles.h>

namespace Varnel {
namespace {

using namespace std::chrono_literals;
using Platform::Testing::Fault;

constexpr auto longTime = std::chrono::hours(1);
const std::string line = std::string(63, 'x') + "\n";

// The thread's own state, as the system shows it: nothing else tells that it would miss a wake-up
// that nobody sends.
void waitUntilTheWriterSleeps() {
  for (;; std::this_thread::yield())
    for (const auto& thread : std::filesystem::directory_iterator("/proc/self/task")) {
      std::string text;
      std::getline(std::ifstream(thread.path() / "stat"), text);
      if (text.find("(Logging Queue) S") != std::string::npos) return;
    }
}

class LogFileChannelTest : public testing::Test {
 protected:
  [[nodiscard]] std::string text() const { return files.text("/log"); }

  Platform::Testing::FakeAppendFiles files;
  Platform::Testing::CapturedOutput output;
};

TEST(LogWritePolicy, WritesAtTheMarkOrAfterTheInterval) {
  using Step = LogWritePolicy::Step;
  const LogWritePolicy policy;
  EXPECT_EQ(policy.step(4096, 0ms), Step::write);
  EXPECT_EQ(policy.step(4095, 999ms), Step::waitForMark);
  EXPECT_EQ(policy.step(1, 1000ms), Step::write);
  EXPECT_EQ(policy.step(0, 999ms), Step::waitForMark);
  EXPECT_EQ(policy.step(0, 5000ms), Step::waitForAnyByte);
}

TEST_F(LogFileChannelTest, WritesByItselfAtTheMark) {
  LogFileChannel channel(files, output, "/log",
                         {.highWaterMark = 2 * 64, .interval = longTime, .pause = 0ms});
  for (std::size_t i = 1; i <= 3; ++i) {
    waitUntilTheWriterSleeps();
    channel.append(line);
    channel.append(line);
    files.waitForAppends(i);
    EXPECT_EQ(text().size(), i * 2 * line.size());
  }
}

TEST_F(LogFileChannelTest, WritesByItselfAfterTheIntervalAlsoWhenItHasSlept) {
  for (const auto interval : {0ms, 1ms}) {
    LogFileChannel channel(files, output, "/log", {.interval = interval, .pause = 0ms});
    for (int i = 1; i <= 20; ++i) {
      const std::size_t before = files.appends();
      // With no interval nothing but an entry wakes it.
      if (interval == 0ms) waitUntilTheWriterSleeps();
      channel.append(line);
      files.waitForAppends(before + 1);
    }
  }
  EXPECT_EQ(text().size(), 40 * line.size());
}

TEST_F(LogFileChannelTest, WritesByItselfOnceInAPauseAndTheRestAtTheEnd) {
  {
    LogFileChannel channel(files, output, "/log",
                           {.highWaterMark = 64, .interval = longTime, .pause = longTime});
    for (int i = 0; i < 3; ++i) {
      waitUntilTheWriterSleeps();
      channel.append(line);
      files.waitForAppends(1);
    }
    waitUntilTheWriterSleeps();
    EXPECT_EQ(text().size(), line.size());
  }
  EXPECT_EQ(text().size(), 3 * line.size());
}

TEST_F(LogFileChannelTest, NeverMakesAnAuthorWaitForTheDisk) {
  LogFileChannel channel(files, output, "/log");
  files.faults->plan(Fault::delays, 1);
  for (int i = 0; i < 10'000; ++i) channel.append(line);
  EXPECT_EQ(text(), "");
  files.faults->mend();
  channel.flush();
  EXPECT_EQ(text().size(), 10'000 * line.size());
}

TEST_F(LogFileChannelTest, ReportsAFullDiskOnceForEachEntryAndGoesOn) {
  LogFileChannel channel(files, output, "/log", {.interval = longTime});
  files.failure = std::errc::no_space_on_device;
  files.faults->plan(Fault::fails, 2, 1);  // after the opening
  channel.append("lost\n");
  channel.append("lost\n");
  channel.flush();
  channel.append("kept\n");
  channel.flush();
  const std::string report = "Did fail to write log to file with error No space left on device\n";
  EXPECT_EQ(output.text(), report + report);
  EXPECT_EQ(text(), "kept\n");
}

TEST_F(LogFileChannelTest, WritesAtOnceInAProcessThatMayHaveNoMoreThreads) {
  Tests::onAKernelThatForbids({SYS_clone, SYS_clone3}, EAGAIN, [&] {
    LogFileChannel channel(files, output, "/log", {.interval = longTime});
    channel.append("entry\n");
    EXPECT_EQ(text(), "entry\n");
  });
}

}  // namespace
}  // namespace Varnel
