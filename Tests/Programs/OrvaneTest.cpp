// SPDX-License-Identifier: MIT
#include <fcntl.h>
#include <gmock/gmock.h>
#include <sys/stat.h>
#include <unistd.h>

#include <csignal>
#include <filesystem>
#include <fstream>
#include <nlohmann/json.hpp>
#include <optional>
#include <string>
#include <thread>
#include <vector>

#include <Tests/Programs/OrvaneFixture.h>

namespace Orvane::Testing {
namespace {

using ::testing::AllOf;
using ::testing::AnyOf;
using ::testing::EndsWith;
using ::testing::HasSubstr;
using ::testing::IsEmpty;
using ::testing::Not;
using ::testing::StartsWith;

TEST_F(Orvane, PrintsTheResultAloneAndLogsTheRun) {
  folder.write("a", "same content");
  folder.write("b", "same content");
  folder.write("c", "other");
  const Outcome text = run({"scan", folder.path()});
  EXPECT_EQ(text.status, 0);
  EXPECT_EQ(text.output, "2 files of 12 bytes, 12 bytes wasted\n  " + folder.path("a") + "\n  " +
                             folder.path("b") +
                             "\n\n3 files in 1 folder: 1 duplicate in 1 group, 12 bytes wasted\n");
  EXPECT_THAT(text.errors, IsEmpty());
  EXPECT_THAT(logText(), AllOf(HasSubstr("Will scan"), HasSubstr("Did find 1 group of")));

  const Outcome json = run({"scan", "--json", "--qos", "background", folder.path()});
  const auto result = nlohmann::json::parse(json.output);
  EXPECT_EQ(result["groups"][0]["files"][1]["path"], folder.path("b"));
  EXPECT_EQ(result["wastedBytes"], 12);
  EXPECT_FALSE(result["partial"]);
  folder.write("kept/a", "same content");
  const Outcome kept = run({"scan", "-j", "--keep-in", folder.path("kept"), folder.path()});
  EXPECT_EQ(nlohmann::json::parse(kept.output)["roots"],
            nlohmann::json({folder.path(), folder.path("kept")}));
  std::filesystem::remove_all(folder.path("kept"));
  const Outcome list = run({"scan", "-0", folder.path()});
  EXPECT_EQ(list.output,
            folder.path("a") + std::string(1, '\0') + folder.path("b") + std::string(2, '\0'));
  EXPECT_THAT(run({"scan", "--summary", folder.path()}).output,
              StartsWith("3 files in 1 folder: "));
  EXPECT_EQ(run({"scan", "--top", "1", folder.path()}).output, text.output);
}

/// Tells when another process opens the file, which waits until then for the object's end.
class LeasedFile final {
 public:
  explicit LeasedFile(const std::string& path) : file_(::open(path.c_str(), O_RDWR | O_CLOEXEC)) {
    ::sigemptyset(&opening_);
    ::sigaddset(&opening_, SIGIO);
    ::pthread_sigmask(SIG_BLOCK, &opening_, &before_);
    isLeased_ = ::fcntl(file_, F_SETLEASE, F_WRLCK) == 0;
  }
  LeasedFile(const LeasedFile&) = delete;
  LeasedFile& operator=(const LeasedFile&) = delete;
  ~LeasedFile() {
    ::close(file_);
    ::pthread_sigmask(SIG_SETMASK, &before_, nullptr);
  }

  [[nodiscard]] bool isLeased() const { return isLeased_; }
  void waitUntilItIsOpened() const {
    int signal = 0;
    ::sigwait(&opening_, &signal);
  }

 private:
  int file_;
  bool isLeased_ = false;
  sigset_t opening_{}, before_{};
};

/// Whether the thread that takes the process's signals has taken all, and waits again.
bool hasTakenSignals(pid_t process) {
  const auto line = [](const std::string& file, const char* name) {
    std::ifstream lines(file);
    for (std::string text; std::getline(lines, text);)
      if (text.starts_with(name)) return text.substr(text.find('\t') + 1);
    return std::string();
  };
  const std::string tasks = "/proc/" + std::to_string(process) + "/task/";
  for (const auto& task : std::filesystem::directory_iterator(tasks)) {
    const std::string status = task.path() / "status";
    if (line(status, "Name:") == "signals")
      return line(status, "ShdPnd:") == std::string(16, '0') &&
             line(status, "State:").starts_with('S');
  }
  return false;
}

TEST_F(Orvane, KeepsWhatItHasWhenItIsInterrupted) {
  for (const char* name : {"a", "b"}) folder.write(name, "same");
  for (const char* option : {"--json", "--print0", "--no-progress"}) {
    std::optional<LeasedFile> held(folder.path("b"));
    if (!held->isLeased()) GTEST_SKIP() << "the file system of temporary files grants no leases";
    // Started with the signal blocked, it keeps it so.
    Varnel::Tests::ChildProcess program({"/usr/bin/env", "--default-signal", "HOME=" + home.path(),
                                         ORVANE_PROGRAM, "scan", option, folder.path()});
    held->waitUntilItIsOpened();
    program.signal(SIGTERM);
    while (!hasTakenSignals(program.identifier())) std::this_thread::yield();
    held.reset();
    const std::string output = program.readAll();
    EXPECT_EQ(program.wait(), 128 + SIGTERM);
    if (option == std::string("--json")) {
      EXPECT_TRUE(nlohmann::json::parse(output)["partial"]);
    } else if (option == std::string("--no-progress")) {
      EXPECT_THAT(output, HasSubstr("interrupted; so far 2 files in 1 folder: "));
    }
  }
}

TEST_F(Orvane, SendsTheLogWhereItIsTold) {
  const auto isLog = AllOf(StartsWith("Will store log at "), HasSubstr(folder.path()));
  const Outcome mixed = run({"scan", "--log-to-stdout", folder.path()});
  EXPECT_THAT(mixed.errors, IsEmpty());
  EXPECT_THAT(mixed.output, AllOf(isLog, EndsWith("no duplicates\n")));
  const Outcome apart = run({"-v", "scan", folder.path()});
  EXPECT_THAT(apart.errors, isLog);
  EXPECT_EQ(apart.output, "0 files in 1 folder: no duplicates\n");
}

TEST_F(Orvane, ScansWhatItIsAskedFor) {
  for (const char* name : {"a.jpg", "b.jpg", "c.txt", ".hidden/d.jpg", "sub/e\nf.jpg", "old/g.jpg"})
    folder.write(name, "same content");
  folder.write("large", "the same content, and more");
  std::filesystem::create_directory_symlink(folder.path("sub"), folder.path("link"));
  const std::string lines = home.write("lines", folder.path("a.jpg") + "\n\n./c.txt\nlost/1");
  const std::string nulls = home.write("nulls", std::string("link/e\nf.jpg\0a.jpg\0", 20));
  const struct {
    std::vector<std::string> arguments;
    std::string summary;
  } cases[] = {
      {{"--include", "*.jpg", "--exclude=old/", "--skip-hidden", "."},
       "3 files in 2 folders: 2 dup"},
      {{"--min-size", "20", "."}, "1 file in 4 folders: no"},
      {{"--max-size=12B", "-x", "."}, "6 files in 4 folders: 5 duplicates in 1 group"},
      {{"-k", "sub", "--keep-in", "old", "."},
       "7 files in 4 folders: 4 duplicates in 1 group, 48 bytes wasted; 2 of the files are to "
       "stay\n"},
      {{"--files-from", lines},
       "3 files in 0 folders: 1 duplicate in 1 group, 12 bytes wasted; 1 file vanished\n"},
      {{"--files-from", nulls, "--null"}, "2 files in 0 folders: 1 duplicate"},
      {{"--files-from", "-"}, "3 files in 0 folders: 1 duplicate"},
  };
  moreEnvironment = {"/usr/bin/env", "-C", folder.path()};
  for (const auto& [arguments, summary] : cases) {
    std::vector<std::string> words = {"scan"};
    words.insert(words.end(), arguments.begin(), arguments.end());
    const Outcome outcome = run(words, "<" + lines + " >\"$HOME/output\"");
    EXPECT_THAT(outcome.output, HasSubstr(summary)) << arguments[0];
  }
}

TEST_F(Orvane, ShowsHostileNamesAsWhatTheyAre) {
  folder.write("fake\n\n9 files of 1 byte\x1b[2J", "same");
  folder.write("\xffno\\slash", "same");
  const Outcome text = run({"scan", folder.path()});
  EXPECT_THAT(text.output, HasSubstr("/fake\\n\\n9 files of 1 byte\\x1B[2J\n"));
  EXPECT_THAT(text.output, HasSubstr("/\\xFFno\\\\slash\n"));

  folder.write("clear\x1b[2J\n[/file", "");
  const Outcome log = run({"scan", "--verbose", folder.path("clear\x1b[2J\n[")});
  EXPECT_THAT(log.errors, AllOf(HasSubstr("/clear\\x1B[2J\\n[\n"), Not(HasSubstr("\x1b"))));

  const Outcome json = run({"scan", "--json", folder.path()});
  const auto files = nlohmann::json::parse(json.output)["groups"][0]["files"];
  EXPECT_EQ(files[0]["path"], folder.path("fake\n\n9 files of 1 byte\x1b[2J"));
  EXPECT_EQ(files[1]["path"], folder.path("\xEF\xBF\xBDno\\slash"));
  EXPECT_EQ(files[1]["url"], "file://" + folder.path("%FFno%5Cslash"));
}

TEST_F(Orvane, PrintsLinks) {
  const Outcome page = run({"link", "https://shop.example/a b?x=1#top"});
  EXPECT_EQ(page.status, 0);
  EXPECT_THAT(page.output,
              AllOf(StartsWith("https://shop.example/a%20b?x=1&orvane2&product=Orvane"),
                    HasSubstr("&lang=en&qnc=&"), EndsWith("#top\n")));
  EXPECT_THAT(run({"link", "--action", "buy", "b=2", "a=1=1"}).output,
              EndsWith("&a=1%3D1&b=2&action=buy\n"));
}

TEST_F(Orvane, RefusesWrongArgumentsInOneLineAndDoesNothing) {
  const std::string missing = folder.path("missing");
  const std::string file = folder.write("file", "x");
  const struct {
    std::vector<std::string> arguments;
    int status;
    std::string naming;
  } cases[] = {
      {{"-v"}, 2, "command"},
      {{"bogus"}, 2, "bogus"},
      {{"scan"}, 2, "FOLDER"},
      {{"scan", ""}, 2, "empty"},
      {{"scan", "--nope", folder.path()}, 2, "--nope"},
      {{"scan", "--qos", "fast\nest", folder.path()}, 2, "fast\\nest"},
      {{"scan", "--min-size", "10q", "."}, 2, "--min-size: \"10q\" is no size"},
      {{"scan", "--min-size", "10\xcb", "."}, 2, "--min-size: \"10\\xCB\" is no size"},
      {{"scan", "--max-size", "1K", "--min-size", "1KiB", "."}, 2, "above the largest"},
      {{"scan", "--exclude", "", "."}, 2, "the pattern is empty"},
      {{"scan", "--keep-in", missing, "."}, 1, missing},
      {{"scan", "--files-from", missing}, 1, "list"},
      {{"scan", "--files-from", folder.path()}, 1, "Is a directory"},
      {{"scan", "--files-from", folder.write("nulls", std::string("a\0b", 3))}, 1, "--null"},
      {{"scan", "--files-from", "/dev/zero"}, 1, "--null"},
      {{"disks", "extra"}, 2, "extra"},
      {{"link"}, 2, "link"},
      {{"link", "a", "b"}, 2, "link"},
      {{"link", "http://a b/"}, 2, "http://a b/"},
      {{"link", "--action", "x", "y"}, 2, "y"},
      {{"link", "--action", "x", "y=1", "y=2"}, 2, "y"},
      {{"analytics", "consent", "maybe"}, 2, "maybe"},
      {{"remind"}, 2, "subcommand"},
      {{"remind", "never"}, 2, "never"},
      {{"help", "bogus"}, 2, "bogus"},
      {{"scan", "--qos"}, 2, "QUALITY"},
      {{"scan", "--top", "-1", "."}, 2, "--top: \"-1\" is no number"},
      {{"scan", "--json=1", "."}, 2, "--json takes no value"},
      {{"remind", "tomorrow", "--found", "1"}, 2, "--selected is missing"},
      {{"remind", "every", "sometimes"}, 2, "sometimes"},
      {{"remind", "tomorrow", "--found", "-5", "--selected", "1"}, 2, "--found: \"-5\" is no"},
      {{"remind", "tomorrow", "--found", "1", "--selected", "0x10"},
       2,
       "--selected: \"0x10\" is no"},
      {{"remind", "tomorrow", "--found", "9223372036854775808", "--selected", "1"},
       2,
       "is more than"},
      {{"sound", "applause"}, 2, "there is no sound \"applause\""},
      {{"scan", missing}, 1, missing},
      {{"scan", folder.path(), missing}, 1, missing},
      {{"scan", file}, 1, file},
      {{"origin", "back\\slash\n"}, 1, "back\\\\slash\\n: No such"},
  };
  for (const auto& [arguments, status, naming] : cases) {
    const Outcome outcome = run(arguments);
    EXPECT_EQ(outcome.status, status) << naming;
    EXPECT_THAT(outcome.output, IsEmpty());
    EXPECT_THAT(outcome.errors, AllOf(StartsWith("orvane: "), HasSubstr(naming), EndsWith("\n")));
    EXPECT_EQ(outcome.errors.find('\n'), outcome.errors.size() - 1) << outcome.errors;
  }
  EXPECT_FALSE(hasLog());
}

TEST_F(Orvane, TakesFoldersOfEveryName) {
  std::vector<std::string> arguments = {"scan"};
  std::filesystem::current_path(folder.path());
  for (const char* name :
       {"[a,b]", "++", "{}", "%%", "x,y", "a=b", "scan", "--", "\xff", "--json"}) {
    folder.write(std::string(name) + "/file", "same");
    if (name == std::string_view("--")) arguments.push_back(name);
    arguments.push_back(name);
  }
  const Outcome outcome = run(arguments);
  EXPECT_EQ(outcome.status, 0) << outcome.errors;
  EXPECT_THAT(outcome.output, StartsWith("10 folders of 1 file and 4 bytes, "));
}

TEST_F(Orvane, FailsWhenItsResultCannotBeWritten) {
  ASSERT_EQ(::mkfifo(home.path("pipe").c_str(), 0600), 0);
  // A pipe whose only reader has gone ends the program, unless it was started to ignore that.
  const std::string gone = "3<>\"$HOME/pipe\" >\"$HOME/pipe\" 3>&-";
  const auto complains = HasSubstr("cannot write the result");
  const struct {
    std::vector<std::string> starter;
    std::string output;
    int status;
    ::testing::Matcher<std::string> errors;
  } cases[] = {
      {{}, ">/dev/full", 1, complains},
      {{}, ">&-", 1, complains},
      {{"/bin/sh", "-c", "trap '' PIPE; exec \"$@\"", "sh"}, gone, 1, complains},
      {{"/usr/bin/env", "--default-signal=PIPE"}, gone, 128 + SIGPIPE, IsEmpty()},
      {{"/usr/bin/env", "--default-signal=PIPE", "--block-signal=PIPE"}, gone, 141, IsEmpty()},
  };
  for (const auto& [starter, output, status, errors] : cases) {
    moreEnvironment = starter;
    for (const char* command : {"scan", "disks", "--version", "help"}) {
      std::vector<std::string> arguments = {command};
      if (arguments[0] == "scan") arguments.push_back(folder.path());
      const Outcome outcome = run(arguments, output);
      EXPECT_EQ(outcome.status, status) << command << output;
      EXPECT_THAT(outcome.errors, errors);
    }
  }
  EXPECT_THAT(logText(), Not(HasSubstr("no duplicates"))) << "the log took the output's place";
}

TEST_F(Orvane, ShowsProgressAndEmphasisOnTerminalsAlone) {
  folder.write("a", "same");
  const std::string erase = "\r\x1b[K";
  const auto onTerminal = [&](const std::string& options) {
    return Varnel::Tests::outputOf("cd " + home.path() + "; HOME=$PWD " + moreEnvironment[0] +
                                   " script -qec 'stty cols 30; " + ORVANE_PROGRAM + " " + options +
                                   "' typescript");
  };
  const std::string scan = "scan " + folder.path();
  moreEnvironment = {"NO_COLOR="};
  EXPECT_THAT(onTerminal(scan),
              AllOf(HasSubstr(erase + "Looking: "),
                    HasSubstr(erase + "\x1b[1m1 file in 1 folder: no\r\nduplicates\x1b[0m\r\n")));
  moreEnvironment = {"NO_COLOR=1"};
  EXPECT_THAT(onTerminal("scan --progress --no-progress " + folder.path()), Not(HasSubstr("\x1b")));
  EXPECT_THAT(onTerminal(scan + " 2>errors"), Not(HasSubstr("\x1b")));
  EXPECT_THAT(run({"scan", "-p", folder.path()}).errors, IsEmpty());
  EXPECT_THAT(onTerminal("scan \"a\\\"b path with blanks, no end\""),
              HasSubstr("orvane: cannot scan\r\n\"a\"b path with blanks, no end\":\r\n"
                        "No such file or directory\r\n"));
  folder.write("b", "same");
  EXPECT_THAT(
      onTerminal("trash --keep oldest " + folder.path()),
      AnyOf(HasSubstr("\n1 file would go to the trash:\r\n4 bytes would be free once it\r\nis "
                      "emptied\r\nnothing was moved yet: --yes\r\ndoes it\r\n"),
            HasSubstr("/b [no trash]\r\n")));
}

TEST_F(Orvane, ShowsPathsAndTheMenu) {
  EXPECT_EQ(run({"path", "--expand", "/usr//lib/", "docs/a"}).output, "/usr/lib\ndocs/a\n");
  const std::string users = run({"path", "--expand", "~"}).output;
  EXPECT_EQ(run({"path", users.substr(0, users.size() - 1) + "/Music/", "x"}).output,
            "~/Music/\nx\n");
  EXPECT_THAT(run({"menu"}).output, AllOf(StartsWith("main-menu.orvane.about\n"),
                                          HasSubstr("\nmain-menu.duplicates.putBackAll\n")));
}

TEST_F(Orvane, ListsTheDiskOfItsFiles) {
  const Outcome text = run({"disks"});
  EXPECT_EQ(text.status, 0);
  const auto disks = nlohmann::json::parse(run({"disks", "--json"}).output)["disks"];
  ASSERT_FALSE(disks.empty());
  for (const auto& disk : disks) {
    EXPECT_GE(disk["maxReaders"], 1);
    for (const auto& volume : disk["volumes"]) EXPECT_THAT(volume, StartsWith("file:///"));
  }
}

}  // namespace
}  // namespace Orvane::Testing
