// SPDX-License-Identifier: MIT
#include <Varnel/Logging/LogFileChannel.h>

#include <gtest/gtest.h>

#include <Platform/Testing/CapturedOutput.h>
#include <Platform/Testing/FakeAppendFiles.h>

namespace Varnel {
namespace {

using namespace std::chrono_literals;

constexpr auto longTime = std::chrono::hours(1);
const std::string line = std::string(63, 'x') + "\n";

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
  LogFileChannel channel(files, output, "/log", {.highWaterMark = 2 * 64, .interval = longTime});
  channel.append(line);
  channel.append(line);
  files.waitForAppends(1);
  EXPECT_EQ(text(), line + line);
}

TEST_F(LogFileChannelTest, WritesByItselfAfterTheIntervalAlsoWhenItHasSlept) {
  LogFileChannel channel(files, output, "/log", {.interval = 1ms});
  for (std::size_t i = 1; i <= 20; ++i) {
    channel.append(line);
    files.waitForAppends(i);
    EXPECT_EQ(text().size(), i * line.size());
  }
}

TEST_F(LogFileChannelTest, NeverMakesAnAuthorWaitForTheDisk) {
  LogFileChannel channel(files, output, "/log");
  files.hold();
  for (int i = 0; i < 10'000; ++i) channel.append(line);
  EXPECT_EQ(text(), "");
  files.release();
  channel.flush();
  EXPECT_EQ(text().size(), 10'000 * line.size());
}

TEST_F(LogFileChannelTest, ReportsAFullDiskOnceForEachEntryAndGoesOn) {
  LogFileChannel channel(files, output, "/log", {.interval = longTime});
  files.failNextAppends(1, std::errc::no_space_on_device);
  channel.append("lost\n");
  channel.append("lost\n");
  channel.flush();
  channel.append("kept\n");
  channel.flush();
  const std::string report = "Did fail to write log to file with error No space left on device\n";
  EXPECT_EQ(output.text(), report + report);
  EXPECT_EQ(text(), "kept\n");
}

TEST_F(LogFileChannelTest, WritesThroughOnceItIsTold) {
  LogFileChannel channel(files, output, "/log", {.interval = longTime});
  channel.append("waiting\n");
  channel.writeThrough();
  EXPECT_EQ(text(), "waiting\n");
  channel.append("late\n");
  EXPECT_EQ(text(), "waiting\nlate\n");
}

}  // namespace
}  // namespace Varnel
