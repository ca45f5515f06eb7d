// SPDX-License-Identifier: MIT
#include <Varnel/Logging/Logger.h>

#include <vector>

#include <gmock/gmock.h>

#include <Tests/Logging/LoggerFixture.h>
#include <Tests/Support/Crew.h>
#include <Varnel/Logging/GenericError.h>
#include <Varnel/Logging/LogEntry.h>
#include <Varnel/Logging/LoggingObject.h>

namespace Varnel {
namespace {

using Platform::URL;
using Tests::nextLine;
using Tests::stamp;
using Tag = LoggingContextTag;

class LoggerTest : public Tests::LoggerFixture {
 protected:
  std::string entryOf(const auto& write) {
    Logger& written = logger();
    const std::size_t before = printed().size();
    write(written);
    return printed().substr(before);
  }
};

TEST_F(LoggerTest, WritesTagsOnOneLineBelowTheMessage) {
  const URL music = URL::fileURLWithPath("/home/ada/Music/");
  const struct {
    std::string author;
    std::string message;
    LoggingContextTags tags;
    std::string entry;
  } rows[] = {
      {"", "", {}, ":  \n"},
      {"Scanner",
       "Did finish",
       {Tag::jobDescription("scan"), Tag::location(music)},
       "Scanner:  Did finish" + nextLine + "job: scan, location: /home/ada/Music\n"},
      {"A",
       "m",
       {Tag::originalErrorType("ScanError"), Tag::originalErrorType(GenericError::fallback),
        Tag::underlyingError(GenericError::fallback),
        Tag::underlyingError(std::runtime_error("no luck"))},
       "A:  m" + nextLine +
           "originally: ScanError, originally: GenericError, underlying error: fallback, "
           "underlying error: no luck\n"},
      {"A",
       "my own\n\x1b[1mline",
       {Tag::location(URL::fileURLWithPath("/a\n[2026-03-14 09:26:39] B:  forged\x1b[2J")),
        Tag::jobDescription("\t\xc2\x9b\\"),
        Tag::underlyingError(std::runtime_error("\xe2\x80\xae\xff"))},
       "A:  my own\n\x1b[1mline" + nextLine +
           "location: /a\\n[2026-03-14 09:26:39] B:  forged\\x1B[2J, job: \\t\\xC2\\x9B\\, "
           "underlying error: \\xE2\\x80\\xAE\\xFF\n"},
  };
  for (const auto& row : rows)
    EXPECT_EQ(entryOf([&](Logger& l) { l.log(row.message, row.author, row.tags); }),
              stamp + row.entry);
  EXPECT_EQ(entryOf([&](Logger& l) { l.log("m", "A", music); }),
            stamp + "A:  m" + nextLine + "location: /home/ada/Music\n");
  EXPECT_EQ(entryOf([&](Logger& l) { l.log("m", "A", std::optional<URL>()); }), stamp + "A:  m\n");
  EXPECT_EQ(entryOf([&](Logger& l) { l.log("m", music); }),
            stamp + ":  m" + nextLine + "location: /home/ada/Music\n");

  destroyLogger();
  EXPECT_EQ(fakes.appendFiles.text(logPath()), printed());
}

TEST_F(LoggerTest, PutsTheCallersPlaceBelowAnError) {
  const int here = __LINE__ + 1;
  const std::string entry = entryOf([](Logger& l) { l.logError(GenericError::fallback, "A"); });
  EXPECT_EQ(entry,
            stamp +
                "A:  [GenericError] Did fail to catch specifi error. Falling back to generic "
                "error." +
                nextLine + "LoggerTest.cpp:" + std::to_string(here) + " -- operator()()\n");

  const SourcePosition where{"/src/Scanner", "run", 12};
  EXPECT_EQ(entryOf([&](Logger& l) {
              l.logError(
                  Platform::PlatformError("D", 7, {{"NSLocalizedDescription", std::string("x")}}),
                  "A", "scan", URL::fileURLWithPath("/f"), where);
            }),
            stamp + "A:  [PlatformError] NSError: Error Domain=D Code=7 \"x\"" + nextLine +
                "Scanner:12 -- run()" + nextLine + "job: scan, location: /f\n");
}

TEST_F(LoggerTest, HidesPathsAndSizesInAnonymousMode) {
  const std::string pictures = home.write("Pictures/a.jpg", "").parent_path().string();
  const auto location = [&](std::string_view path) {
    return logger().stringForFileURL(URL::fileURLWithPath(path)).value_or("absent");
  };
  EXPECT_EQ(location("/a/b.tar.gz"), "/a/b.tar.gz");
  EXPECT_EQ(logger().stringForFileSize(3'456'789), "3.5 MB");
  EXPECT_EQ(logger().stringForFileSize(1500), "2 KB");
  EXPECT_EQ(logger().stringForMemorySize(1500), "1 KB");

  logger().setIsAnonymousMode(true);
  EXPECT_EQ(location("/a/b.tar.gz"), "[*.gz]");
  EXPECT_EQ(location("/a/Pictures.bundle/"), "directory");
  EXPECT_EQ(location(pictures), "directory");
  EXPECT_EQ(location(pictures + "/a.jpg"), "[*.jpg]");
  EXPECT_EQ(location("/a/secret"), "absent");
  EXPECT_EQ(entryOf([](Logger& l) { l.log("m", "A", URL::fileURLWithPath("/a/secret")); }),
            stamp + "A:  m\n");
  EXPECT_EQ(logger().stringForFileSize(3'456'789), "5 MB");
}

TEST_F(LoggerTest, TellsTimings) {
  EXPECT_EQ(logger().stringForTiming(3903.9), "1h 5m 3s");
  EXPECT_EQ(logger().stringForTiming(std::numeric_limits<double>::infinity()), "undefined");
  const Platform::Date start = fakes.clock.now();
  fakes.clock.advance(std::chrono::seconds(61));
  EXPECT_EQ(logger().stringForTiming(start), "1m 1s");
  EXPECT_EQ(logger().stringForTiming(fakes.clock.now(), start), "-1m 1s");
}

TEST_F(LoggerTest, KeepsTheFileOfTheDayItWasMadeOn) {
  (void)logger();
  EXPECT_EQ(fakes.standardOutput.text(), "Will store log at " + logPath() + "\n");
  EXPECT_EQ(logger().logFileURL(), URL::fileURLWithPath(logPath()));
  fakes.clock.advance(std::chrono::hours(24));
  logger().log("next day");
  logger().flush();
  EXPECT_EQ(fakes.appendFiles.text(logPath()), "[2026-03-15 09:26:39] :  next day\n");
}

TEST_F(LoggerTest, CountsTheYearByItsWeeks) {
  fakes.clock.advance(std::chrono::hours(24 * 288));  // to Sunday, the 27th of December
  logger().log("m", "A");
  EXPECT_EQ(printed(), "[2027-12-27 09:26:39] A:  m\n");
  EXPECT_THAT(logger().logFileURL()->path(), testing::EndsWith("/2027-12-27.log"));
  ::setenv("LC_ALL", "en_US.UTF-8", 1);
  EXPECT_EQ(Logger::logMessageDateFormatter().string(fakes.clock.now()), "2027-12-27 09:26:39");
  EXPECT_EQ(Logger::fileNameDateFormatter().string(fakes.clock.now()), "2027-12-27");
}

TEST_F(LoggerTest, GoesOnWithoutAFolder) {
  fakes.userAccount.home = home.write("file", "in the way").string();
  (void)logger();
  EXPECT_EQ(fakes.standardOutput.text(), "Unable to write log to file " + logPath() +
                                             " with error Error Domain=generic Code=20 \"" +
                                             fakes.userAccount.home +
                                             "/Library: Not a directory\"\n"
                                             "Will NOT store log\n");
  EXPECT_EQ(logger().logFileURL(), std::nullopt);
  logger().log("m", "A");
  logger().flush();
  EXPECT_EQ(printed(), stamp + "A:  m\n");
}

TEST_F(LoggerTest, GoesOnWithoutAFile) {
  fakes.appendFiles.failure = std::errc::permission_denied;
  fakes.appendFiles.faults->plan(Platform::Testing::Fault::fails, 1);
  logger().flush();
  EXPECT_EQ(logger().logFileURL(), URL::fileURLWithPath(logPath()));
  const std::string atStart = fakes.standardOutput.text();
  EXPECT_NE(atStart.find("Will store log at " + logPath() + "\n"), std::string::npos);
  EXPECT_NE(atStart.find("Unable to write log to file " + logPath() + " with error 13\n"),
            std::string::npos);
  logger().log("m", "A");
  destroyLogger();
  EXPECT_EQ(fakes.standardOutput.text(), atStart + stamp + "A:  m\n");
}

TEST_F(LoggerTest, KeepsTheEntriesOfManyThreadsWholeAndInOrder) {
  constexpr int entries = 2000;
  (void)logger();
  Tests::Crew(4, [this](unsigned author) {
    for (int i = 0; i < entries; ++i) {
      if (i % 100 == 0) logger().setIsAnonymousMode(i % 200 == 0);
      logger().log(std::to_string(i), std::to_string(author));
    }
  });
  destroyLogger();

  std::istringstream lines(fakes.appendFiles.text(logPath()));
  std::vector<int> next(4, 0);
  for (std::string line; std::getline(lines, line);) {
    const int author = line.at(stamp.size()) - '0';
    EXPECT_EQ(line, stamp + std::to_string(author) + ":  " +
                        std::to_string(next.at(static_cast<std::size_t>(author))++));
  }
  EXPECT_EQ(next, std::vector<int>(4, entries));
  EXPECT_EQ(printed().size(), fakes.appendFiles.text(logPath()).size());
}

class Caller final : public LoggingObject {
 public:
  explicit Caller(Logger& logger) : logger_(logger) { logError(GenericError::fallback); }
  Logger& logger() const override { return logger_; }
  std::string_view logAuthor() const override { return "Caller"; }

  void member() { logError(GenericError::fallback, LoggingContextTags()); }
  template <typename Type>
  void instance(Type) {
    logError(GenericError::fallback, "job");
  }
  bool operator<(int) {
    logError(GenericError::fallback);
    return true;
  }

 private:
  Logger& logger_;
};

TEST_F(LoggerTest, WritesTheEntriesOfAnObjectUnderItsName) {
  const Caller object(logger());
  const URL folder = URL::fileURLWithPath("/f");
  const SourcePosition where{"/src/Scanner.cpp", "run", 12};
  const std::string error =
      "Caller:  [GenericError] " + GenericError::fallback.logDescription() + nextLine;
  const std::string place = error + "Scanner.cpp:12 -- run()";
  const struct {
    std::function<void()> write;
    std::string entry;
  } rows[] = {
      {[&] { object.log("m"); }, "Caller:  m"},
      {[&] {
         object.log("m", {Tag::jobDescription("scan"), Tag::location(folder)});
       },
       "Caller:  m" + nextLine + "job: scan, location: /f"},
      {[&] { object.log("m", folder); }, "Caller:  m" + nextLine + "location: /f"},
      {[&] { object.logError(GenericError::fallback, {Tag::jobDescription("scan")}, where); },
       place + nextLine + "job: scan"},
      {[&] { object.logError(GenericError::fallback, "scan", folder, where); },
       place + nextLine + "job: scan, location: /f"},
      {[&] { object.logError(GenericError::fallback, "scan"); },
       error + "LoggerTest.cpp:" + std::to_string(__LINE__ - 1) + " -- operator()()" + nextLine +
           "job: scan"},
  };
  for (const auto& row : rows)
    EXPECT_EQ(entryOf([&](Logger&) { row.write(); }), stamp + row.entry + "\n");
}

TEST_F(LoggerTest, NamesTheCallingFunctionAlone) {
  const auto locationOf = [this](const auto& call) {
    const std::string entry = entryOf(call);
    const std::size_t start = entry.find(" -- ") + 4;
    return entry.substr(start, entry.find('\n', start) - start);
  };
  const auto caller = [](Logger& l) { return Caller(l); };
  EXPECT_EQ(locationOf(caller), "Caller()");
  Caller object(logger());
  EXPECT_EQ(locationOf([&](Logger&) { object.member(); }), "member()");
  EXPECT_EQ(locationOf([&](Logger&) { object.instance(std::vector<int>()); }), "instance()");
  EXPECT_EQ(locationOf([&](Logger&) { (void)(object < 1); }), "operator<()");
  EXPECT_EQ(locationOf([&](Logger&) {
              [&](auto) { object.logger().logError(GenericError::fallback); }(1);
            }),
            "operator()()");
}

}  // namespace
}  // namespace Varnel
