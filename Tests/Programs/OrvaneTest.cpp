// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>
#include <sys/stat.h>
#include <sys/xattr.h>

#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <nlohmann/json.hpp>
#include <sstream>
#include <string>
#include <vector>

#include <Tests/Programs/ScanFolder.h>
#include <Tests/Support/ChildProcess.h>

namespace Orvane::Testing {
namespace {

using ::testing::AllOf;
using ::testing::EndsWith;
using ::testing::HasSubstr;
using ::testing::IsEmpty;
using ::testing::Not;
using ::testing::StartsWith;

struct Outcome {
  int status = -1;  ///< As a shell tells it.
  std::string output;
  std::string errors;
};

/// Runs the program with a home folder and a working folder of its own.
class Orvane : public ::testing::Test {
 protected:
  /// The arguments go to a shell that opens the files and becomes the program.
  Outcome run(const std::vector<std::string>& arguments,
              const std::string& redirection = ">\"$HOME/output\"") {
    std::vector<std::string> words = {"/usr/bin/env", "-i", "HOME=" + home.path()};
    // A sanitizer keeps to the settings of the test in the program too.
    for (const char* name : {"TSAN_OPTIONS", "ASAN_OPTIONS", "LSAN_OPTIONS"})
      if (const char* value = std::getenv(name)) words.push_back(std::string(name) + "=" + value);
    words.insert(words.end(), moreEnvironment.begin(), moreEnvironment.end());
    words.insert(
        words.end(),
        {"/bin/sh", "-c", "exec \"$0\" \"$@\" 2>\"$HOME/errors\" " + redirection, ORVANE_PROGRAM});
    words.insert(words.end(), arguments.begin(), arguments.end());
    const int status = Varnel::Tests::ChildProcess(words).wait();
    return {status, read(home.path("output")), read(home.path("errors"))};
  }

  std::string logText() const {
    std::string text;
    for (const auto& entry : std::filesystem::recursive_directory_iterator(home.path()))
      if (entry.path().extension() == ".log") text += read(entry.path());
    return text;
  }

  void expectFailure(const std::vector<std::string>& arguments, const std::string& complaint) {
    const Outcome outcome = run(arguments);
    EXPECT_EQ(outcome.status, 1);
    EXPECT_THAT(outcome.output, IsEmpty());
    EXPECT_THAT(outcome.errors, HasSubstr(complaint));
  }

  bool hasLog() const { return std::filesystem::exists(home.path("Library")); }

  ScanFolder folder;
  ScanFolder home;
  /// A program that runs another may follow.
  std::vector<std::string> moreEnvironment;

  static std::string read(const std::string& path) {
    std::ostringstream text;
    text << std::ifstream(path, std::ios::binary).rdbuf();
    return text.str();
  }
};

TEST_F(Orvane, PrintsTheResultAloneAndLogsTheRun) {
  folder.write("a", "same content");
  folder.write("b", "same content");
  folder.write("c", "other");
  const Outcome text = run({"scan", folder.path()});
  EXPECT_EQ(text.status, 0);
  EXPECT_EQ(text.output, "2 files of 12 bytes, 12 bytes wasted\n  " + folder.path("a") + "\n  " +
                             folder.path("b") +
                             "\n\n3 files in 1 folder: 1 duplicate in 1 group, 12 bytes wasted\n");
  EXPECT_THAT(text.errors, AllOf(HasSubstr("Will scan"), HasSubstr(folder.path())));
  EXPECT_THAT(logText(), HasSubstr("Did find 1 groups"));

  const Outcome json = run({"scan", "--json", "--qos", "background", folder.path()});
  const auto result = nlohmann::json::parse(json.output);
  EXPECT_EQ(result["groups"],
            nlohmann::json::parse(R"([{"size": 12, "paths": [")" + folder.path("a") + R"(", ")" +
                                  folder.path("b") + R"("]}])"));
  EXPECT_EQ(result["wastedBytes"], 12);
}

TEST_F(Orvane, SendsTheLogWhereItIsTold) {
  const Outcome outcome = run({"scan", "--log-to-stdout", folder.path()});
  EXPECT_THAT(outcome.errors, IsEmpty());
  EXPECT_THAT(outcome.output, AllOf(StartsWith("Will store log at "), EndsWith("no duplicates\n")));
}

TEST_F(Orvane, ShowsHostileNamesAsWhatTheyAre) {
  folder.write("fake\n\n9 files of 1 byte\x1b[2J", "same");
  folder.write("\xffno\\slash", "same");
  const Outcome text = run({"scan", folder.path()});
  EXPECT_THAT(text.output, HasSubstr("/fake\\n\\n9 files of 1 byte\\x1B[2J\n"));
  EXPECT_THAT(text.output, HasSubstr("/\\xFFno\\\\slash\n"));

  folder.write("clear\x1b[2J\n[/file", "");
  const Outcome log = run({"scan", folder.path("clear\x1b[2J\n[")});
  EXPECT_THAT(log.errors, AllOf(HasSubstr("/clear\\x1B[2J\\n[\n"), Not(HasSubstr("\x1b"))));

  const Outcome json = run({"scan", "--json", folder.path()});
  const auto group = nlohmann::json::parse(json.output)["groups"][0];
  EXPECT_EQ(group["paths"][0], folder.path("fake\n\n9 files of 1 byte\x1b[2J"));
  EXPECT_EQ(group["paths"][1], folder.path("\xEF\xBF\xBDno\\slash"));
  EXPECT_EQ(group["urls"][1], "file://" + folder.path("%FFno%5Cslash"));
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
      {{}, 2, "command"},
      {{"bogus"}, 2, "bogus"},
      {{"scan"}, 2, "FOLDER"},
      {{"scan", ""}, 2, "empty"},
      {{"scan", "--nope", folder.path()}, 2, "--nope"},
      {{"scan", "--qos", "fast\nest", folder.path()}, 2, "fast\\nest"},
      {{"disks", "extra"}, 2, "extra"},
      {{"link"}, 2, "link"},
      {{"link", "a", "b"}, 2, "link"},
      {{"link", "http://a b/"}, 2, "http://a b/"},
      {{"link", "--action", "x", "y"}, 2, "y"},
      {{"link", "--action", "x", "y=1", "y=2"}, 2, "y"},
      {{"analytics", "consent", "maybe"}, 2, "maybe"},
      {{"remind"}, 2, "subcommand"},
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
  for (const char* name : {"[a,b]", "++", "{}", "%%", "x,y", "a=b", "scan", "disks"}) {
    folder.write(std::string(name) + "/file", "same");
    arguments.push_back(name);
  }
  folder.write("--json/file", "same");
  arguments.insert(arguments.end(), {"--", "--json"});
  const Outcome outcome = run(arguments);
  EXPECT_EQ(outcome.status, 0) << outcome.errors;
  EXPECT_THAT(outcome.output, StartsWith("9 files of "));
}

TEST_F(Orvane, FailsWhenItsResultCannotBeWritten) {
  ASSERT_EQ(::mkfifo(home.path("pipe").c_str(), 0600), 0);
  // The last is a pipe whose only reader has gone.
  for (const char* output : {">/dev/full", ">&-", "3<>\"$HOME/pipe\" >\"$HOME/pipe\" 3>&-"}) {
    for (const char* command : {"scan", "disks", "--version"}) {
      std::vector<std::string> arguments = {command};
      if (arguments[0] == "scan") arguments.push_back(folder.path());
      const Outcome outcome = run(arguments, output);
      EXPECT_EQ(outcome.status, 1) << command;
      EXPECT_THAT(outcome.errors, HasSubstr("cannot write the result"));
    }
  }
  EXPECT_THAT(logText(), Not(HasSubstr("no duplicates"))) << "the log took the output's place";
}

TEST_F(Orvane, ShowsPathsAndTheMenu) {
  EXPECT_EQ(run({"path", "--expand", "/usr//lib/", "docs/a"}).output, "/usr/lib\ndocs/a\n");
  const std::string users = run({"path", "--expand", "~"}).output;
  EXPECT_EQ(run({"path", users.substr(0, users.size() - 1) + "/Music/", "x"}).output,
            "~/Music/\nx\n");
  EXPECT_THAT(run({"menu"}).output, AllOf(StartsWith("main-menu.orvane.about\n"),
                                          HasSubstr("\nmain-menu.duplicates.putBackAll\n")));
}

TEST_F(Orvane, SendsEventsOnlyToUsersWhoAgreed) {
  const std::string spool = home.path(".local/state/com.quennel.Orvane2/analytics.sqlite");
  const std::string settings = home.path(".config/com.quennel.Orvane2/settings.ini");
  const std::vector<std::string> scan = {"scan", "--analytics", "https://127.0.0.1:1",
                                         folder.path()};
  const auto ask = [&](const char* complaint) {
    const Outcome outcome = run(scan);
    EXPECT_EQ(outcome.status, 0);
    EXPECT_THAT(outcome.errors,
                StartsWith(std::string("orvane: no events are sent: ") + complaint));
    EXPECT_THAT(outcome.errors, Not(HasSubstr("Category:")));
    EXPECT_EQ(outcome.errors.find("no events"), outcome.errors.rfind("no events"));
  };
  ask("the user has not been asked");
  EXPECT_FALSE(std::filesystem::exists(spool));
  auto printing = scan;
  printing.push_back("--print-events");
  EXPECT_THAT(run(printing).errors, HasSubstr("Category: `Scan` Action: `Started`"));
  EXPECT_EQ(run({"analytics"}).output, "consent: not asked\n");
  EXPECT_FALSE(std::filesystem::exists(settings)) << "asking is not answering";

  EXPECT_EQ(run({"analytics", "consent", "yes"}).output, "consent: yes\n");
  EXPECT_EQ(run({"analytics", "consent"}).output, "consent: yes\n");
  EXPECT_THAT(run(scan).errors, Not(HasSubstr("no events")));
  EXPECT_TRUE(std::filesystem::exists(spool));

  EXPECT_EQ(run({"analytics", "consent", "no"}).output, "consent: no\n");
  ask("the user has refused");

  const std::string elsewhere = home.path("elsewhere");
  std::filesystem::rename(spool, elsewhere);
  std::filesystem::create_symlink(elsewhere, spool);
  expectFailure({"analytics", "consent", "no"},
                "orvane: the events that wait cannot be thrown away now");
}

// A link where the settings should be is no setting of this program.
TEST_F(Orvane, SaysThatAnAnswerIsNotKept) {
  const std::string mine = home.write("mine", "[Defaults]\nanalyticsConsent=true\n");
  std::filesystem::create_directories(home.path(".config/com.quennel.Orvane2"));
  std::filesystem::create_symlink(mine, home.path(".config/com.quennel.Orvane2/settings.ini"));
  for (const auto& command : {std::vector<std::string>{"analytics", "consent", "yes"},
                              {"analytics", "consent", "no"},
                              {"remind", "every", "weekly"}})
    expectFailure(command, "orvane: cannot keep the ");
  EXPECT_EQ(run({"analytics"}).output, "consent: not asked\n");
}

// Without a session bus: planning needs none.
TEST_F(Orvane, PlansReminders) {
  const auto period = [](const char* name) { return StartsWith(std::string("period: ") + name); };
  const auto regular = HasSubstr("  SchedulerNotification: Time to clean up");
  const auto found = [](const char* size) { return HasSubstr(std::string("free up to ") + size); };
  EXPECT_EQ(run({"remind", "status"}).output, "period: Never\n");
  EXPECT_THAT(run({"remind", "every", "weekly"}).output, AllOf(period("Every Week"), regular));
  run({"remind", "tomorrow", "--found", "1500000", "--selected", "0"});
  EXPECT_THAT(
      run({"remind", "tomorrow", "--found", "9223372036854775807", "--selected", "010"}).output,
      AllOf(period("Every Week"), regular, found("9.22 EB"), Not(found("1.5 MB"))));
  // A plan outlives the setting that it was made from.
  const std::string settings = home.path(".config/com.quennel.Orvane2/settings.ini");
  std::ofstream(settings) << "damaged";
  EXPECT_THAT(
      run({"remind", "tomorrow", "--found", "9223372036854775807", "--selected", "1"}).output,
      AllOf(period("Never"), regular));
  // Each scan plans the reminder of the period anew.
  run({"remind", "every", "weekly"});
  std::filesystem::remove(home.path(".local/state/com.quennel.Orvane2/notifications.sqlite"));
  EXPECT_EQ(run({"scan", folder.path()}).status, 0);
  EXPECT_THAT(run({"remind", "status"}).output, AllOf(period("Every Week"), regular));
  run({"remind", "tomorrow", "--found", "9223372036854775807", "--selected", "1"});
  EXPECT_THAT(run({"remind", "every", "never"}).output, AllOf(period("Never"), Not(regular)));
  EXPECT_EQ(run({"scan", folder.path()}).status, 0);
  const Outcome status = run({"remind", "status"});
  EXPECT_THAT(status.output, AllOf(period("Never"), found("9.22 EB"), Not(regular)));
  EXPECT_EQ(status.status, 0);
}

// Whatever the mask of modes, and not in the home of another, who could not use them.
TEST_F(Orvane, MakesTheFoldersOfItsStoresForItsUserAlone) {
  namespace fs = std::filesystem;
  moreEnvironment = {"/bin/sh", "-c", "umask 0; exec \"$@\"", "sh"};
  const std::vector<std::string> plan = {"remind", "tomorrow", "--found", "1", "--selected", "0"};
  EXPECT_EQ(run(plan).status, 0);
  for (const char* made : {".local", ".local/state", ".local/state/com.quennel.Orvane2", "Library",
                           "Library/Logs/com.quennel.Orvane2"})
    EXPECT_EQ(fs::status(home.path(made)).permissions(), fs::perms::owner_all) << made;
  fs::remove_all(home.path(".local"));
  fs::remove_all(home.path("Library"));
  if (::chown(home.path().c_str(), 1234, static_cast<gid_t>(-1)) != 0) GTEST_SKIP() << "not root";
  EXPECT_EQ(run(plan).status, 1);
  EXPECT_FALSE(fs::exists(home.path(".local")));
}

// All that lies beside the settings and the stores is told to the user.
TEST_F(Orvane, KeepsItsFilesWhereTheDocumentsSay) {
  run({"analytics", "consent", "yes"});
  run({"scan", "--analytics", "https://127.0.0.1:1", folder.path()});
  run({"remind", "every", "weekly"});
  const std::string documents = read(VARNEL_DOCUMENTS "/context.md");
  for (const char* place : {".config", ".local/state"})
    for (const auto& entry : std::filesystem::directory_iterator(
             home.path(std::string(place) + "/com.quennel.Orvane2"))) {
      const std::string name = entry.path().filename();
      const std::size_t end = name.find_first_of("-.", name.find('.') + 1);
      EXPECT_THAT(documents,
                  HasSubstr(end == std::string::npos ? name : "`" + name.substr(end) + "`"));
    }
}

TEST_F(Orvane, PlaysTheFrameworksSoundsToTheirEnd) {
  EXPECT_EQ(run({"sound", "purchase"}).status, 0);
}

TEST_F(Orvane, SaysWhatItLacksToPlayASound) {
  moreEnvironment = {"GST_PLUGIN_SYSTEM_PATH=" + folder.path(),
                     "GST_REGISTRY=" + folder.path("registry")};
  expectFailure({"sound", "start"}, "this machine cannot play sounds\n");

  // A copy of the library has its resources, but no modules beside it.
  namespace fs = std::filesystem;
  const fs::path library = VARNEL_LIBRARY;
  const fs::path modules = folder.path("lib/" VARNEL_MODULES_NAME);
  fs::create_directories(modules);
  fs::copy_file(library, modules.parent_path() / VARNEL_LIBRARY_NAME);
  fs::create_directory_symlink(library.parent_path() / "../share", folder.path("share"));
  moreEnvironment = {"LD_LIBRARY_PATH=" + modules.parent_path().string()};
  expectFailure({"sound", "start"}, "libvarnel-gstreamer.so, was not built or is not installed\n");

  std::ofstream(modules / "libvarnel-gstreamer.so") << "no module";
  expectFailure({"sound", "start"}, "libvarnel-gstreamer.so, does not load: ");
}

TEST_F(Orvane, ExplainsAFilesAttributeAndIdentifiesTheInstallation) {
  const std::string file = folder.path("download");
  std::ofstream(file) << "x";
  EXPECT_THAT(run({"origin", file}).output, HasSubstr("\nevent: none\n"));
  constexpr std::string_view attribute = "0083;60000000;Bro\nwser;E1";
  if (::setxattr(file.c_str(), "user.com.apple.quarantine", attribute.data(), attribute.size(), 0))
    GTEST_SKIP() << "The file system of " << file << " keeps no attributes.";
  const nlohmann::json facts = {{"file", file},
                                {"flags", "0083"},
                                {"date", "2021-01-14 08:25:36 UTC"},
                                {"agentName", "Bro\nwser"},
                                {"eventIdentifier", "E1"},
                                {"dataURL", nullptr}};
  EXPECT_EQ(nlohmann::json::parse(run({"origin", "--json", file}).output), facts);
  EXPECT_THAT(run({"origin", file}).output, HasSubstr("\ndownloaded by: Bro\\nwser\n"));
  EXPECT_EQ(run({"origin", folder.path("missing")}).status, 1);

  const auto user = nlohmann::json::parse(run({"identify", "--json"}).output);
  EXPECT_EQ(user["userIdentifier"].get<std::string>().size(), 64u);
  EXPECT_EQ(user["uniqueClientIdentifier"], user["userIdentifier"]);
}

// The database is none here, which the system's log is told at each opening.
TEST_F(Orvane, LooksOnceForWhatItWasDownloadedFrom) {
  for (const auto& command :
       {std::vector<std::string>{"identify"}, {"scan", "--print-events", folder.path()}}) {
    const std::string errors = run(command).errors;
    constexpr std::string_view opening = "Failed to open database!";
    EXPECT_EQ(errors.find(opening), errors.rfind(opening)) << errors;
  }
}

TEST_F(Orvane, ListsTheDiskOfItsFiles) {
  const Outcome text = run({"disks"});
  EXPECT_EQ(text.status, 0);
  const auto disks = nlohmann::json::parse(run({"disks", "--json"}).output)["disks"];
  ASSERT_FALSE(disks.empty());
  for (const auto& disk : disks) {
    EXPECT_GE(disk["maxTreads"], 1);
    for (const auto& volume : disk["volumes"]) EXPECT_THAT(volume, StartsWith("file:///"));
  }
}

}  // namespace
}  // namespace Orvane::Testing
