// SPDX-License-Identifier: MIT
#include <algorithm>
#include <filesystem>
#include <fstream>
#include <map>
#include <sstream>
#include <string>

#include <gmock/gmock.h>

#include <Tests/Support/ChildProcess.h>
#include <Tests/Support/TemporaryFolder.h>
#include <Varnel/Platform/Ports/ReadFile.h>

namespace Varnel {
namespace {

namespace fs = std::filesystem;
using testing::EndsWith;
using testing::HasSubstr;

// Runs the logging process in a home folder of its own.
class LoggerProcessTest : public testing::Test {
 protected:
  [[nodiscard]] Tests::ChildProcess start(const std::string& arguments,
                                          const std::string& before = "") const {
    return Tests::ChildProcess({"/bin/sh", "-c",
                                before + "HOME='" + home.path().string() +
                                    "' TSAN_OPTIONS=\"$TSAN_OPTIONS die_after_fork=0\" exec '" +
                                    VARNEL_LOGGER_PROCESS "' " + arguments});
  }

  // All that the process prints until it ends.
  [[nodiscard]] std::string run(const std::string& arguments) const {
    Tests::ChildProcess process = start(arguments);
    std::string output = process.readAll();
    process.wait();
    return output;
  }

  // The only log file below the home folder.
  [[nodiscard]] fs::path logPath() const {
    for (const auto& entry : fs::recursive_directory_iterator(home.path() / "Library/Logs"))
      if (entry.path().extension() == ".log") return entry.path();
    return {};
  }
  [[nodiscard]] std::string log() const { return Platform::readFile(logPath()).valueOr(""); }

  Tests::TemporaryFolder home;
};

// The entries alone, without what the logger prints for itself at its start.
std::string entriesIn(const std::string& printed) {
  std::istringstream lines(printed);
  std::string entries;
  for (std::string line; std::getline(lines, line);)
    if (line.starts_with('[')) entries += line + "\n";
  return entries;
}

TEST_F(LoggerProcessTest, LosesNothingWhenTheProcessExits) {
  const std::string printed = run("exit A 300 0");
  EXPECT_THAT(printed, HasSubstr("Will store log at " + logPath().string() + "\n"));
  EXPECT_THAT(log(), EndsWith("A:  299\n"));
  EXPECT_EQ(log(), entriesIn(printed));
  EXPECT_EQ(fs::status(logPath()).permissions(), fs::perms::owner_read | fs::perms::owner_write);

  (void)run("quick-exit B 1 0");
  EXPECT_THAT(log(), EndsWith("B:  0\n"));
  (void)run("late-entry C 1 0");
  EXPECT_THAT(log(), EndsWith("C:  late\n"));
}

TEST_F(LoggerProcessTest, SharesTheFileWithAnotherProcess) {
  Tests::ChildProcess first = start("exit A 20000 0 >/dev/null");
  Tests::ChildProcess second = start("exit B 20000 0 >/dev/null");
  EXPECT_EQ(first.wait() + second.wait(), 0);

  std::istringstream lines(log());
  std::map<char, int> next;
  for (std::string line; std::getline(lines, line);) {
    const std::string entry = line.substr(line.find(']') + 2);
    ASSERT_EQ(entry.substr(1), ":  " + std::to_string(next[entry[0]]++)) << line;
  }
  EXPECT_EQ(next, (std::map<char, int>{{'A', 20000}, {'B', 20000}}));
}

TEST_F(LoggerProcessTest, LosesAtMostASecondOr4096BytesWhenKilled) {
  constexpr std::size_t slowEntries = 60;
  const std::string printed = entriesIn(run("killed S 60 30"));
  // A second's worth at 30 ms each, and half as much again for a machine that is busy.
  constexpr std::size_t lostInTime = 50;
  const auto kept = static_cast<std::size_t>(std::ranges::count(log(), '\n'));
  EXPECT_GE(kept, slowEntries - lostInTime);
  EXPECT_TRUE(printed.starts_with(log()));

  fs::remove(logPath());
  const std::string manyPrinted = entriesIn(run("killed F 600 1"));
  EXPECT_TRUE(manyPrinted.starts_with(log()));
  EXPECT_LE(manyPrinted.size() - log().size(), 4096u + 4096u);
}

TEST_F(LoggerProcessTest, GoesOnWhenTheDiskIsFull) {
  (void)run("exit A 1 0");
  const fs::path path = logPath();
  fs::remove(path);
  fs::create_symlink("/dev/full", path);
  const std::string printed = run("exit A 3 0");
  EXPECT_EQ(entriesIn(printed).size(), 3 * entriesIn(run("exit A 1 0")).size());
  const std::string report = "Did fail to write log to file with error No space left on device\n";
  EXPECT_THAT(printed, HasSubstr(report + report + report));

  fs::remove(path);
  std::ofstream(path) << std::string(4096, '\n');
  Tests::ChildProcess limited = start("exit A 3 0", "ulimit -f 1; ");
  EXPECT_THAT(limited.readAll(), HasSubstr("log to file with error File too large\n"));
  EXPECT_EQ(limited.wait(), 0) << "not killed";

  const fs::path printedTo = home.path() / "printed";
  EXPECT_EQ(start("exit A 2000 0 >'" + printedTo.string() + "'", "ulimit -f 16; ").wait(), 0);
  EXPECT_EQ(fs::file_size(printedTo), 16 * 512u);
}

TEST_F(LoggerProcessTest, OutlivesTheReaderOfItsStandardOutput) {
  // A few entries meet the closed pipe only when the process ends.
  for (const std::string count : {"3", "2000"}) {
    EXPECT_EQ(start("without-reader A " + count + " 0").wait(), 0);
    EXPECT_THAT(log(), HasSubstr("A:  " + std::to_string(std::stoi(count) - 1) + "\n"));
    EXPECT_THAT(log(), EndsWith("A:  late\n"));
  }
}

TEST_F(LoggerProcessTest, PrintsIntoNoFileThatHasTheNumberOfAClosedStream) {
  for (const std::string arguments : {"exit A 3 0 >&-", "standard-error A 2000 0 2>&-"}) {
    EXPECT_EQ(start(arguments).wait(), 0);
    EXPECT_EQ(*Platform::readFile(home.path() / "document"), "") << arguments;
  }
  EXPECT_THAT(log(), EndsWith("A:  1999\n"));
}

TEST_F(LoggerProcessTest, WritesEachEntryOnceThoughTheProcessForks) {
  const std::string printed = entriesIn(run("forked A 3 0"));
  EXPECT_EQ(std::ranges::count(printed, '\n'), 5) << printed;
  EXPECT_THAT(printed, EndsWith("A:  grown\n"));
  // Parent and child write theirs when they end.
  EXPECT_EQ(std::ranges::count(log(), '\n'), 5) << log();
  EXPECT_THAT(log(), HasSubstr("A:  grown\n"));
  const std::string printedInBetween = entriesIn(run("forked-in-between B 3 0"));
  EXPECT_EQ(std::ranges::count(printedInBetween, '\n'), 5) << printedInBetween;

  (void)run("daemon C 3 0");
  EXPECT_THAT(log(), EndsWith("C:  2\n")) << "of the parent, which ends without its exit handlers";
}

TEST_F(LoggerProcessTest, LeavesStandardOutputToAHostThatAsksForIt) {
  EXPECT_EQ(run("standard-error A 3 0 2>/dev/null"), "");
  const std::string printed = entriesIn(run("standard-error B 3 0 2>&1 >/dev/null"));
  EXPECT_THAT(printed, EndsWith("B:  2\n"));
  EXPECT_THAT(log(), EndsWith(printed));
}

}  // namespace
}  // namespace Varnel
