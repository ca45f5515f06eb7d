// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>
#include <unistd.h>

#include <chrono>
#include <filesystem>
#include <nlohmann/json.hpp>
#include <set>
#include <string>
#include <vector>

#include <Removal/RemovalJournal.h>
#include <Tests/Programs/OrvaneFixture.h>
#include <Varnel/Platform/Ports/Ports.h>
#include <Varnel/Platform/Ports/PrivateFiles.h>

namespace Orvane::Testing {
namespace {

namespace fs = std::filesystem;
using ::testing::AllOf;
using ::testing::HasSubstr;
using ::testing::IsEmpty;
using ::testing::Not;

class OrvaneData : public Orvane {
 protected:
  const std::string settings = home.path(".config/com.quennel.Orvane2/settings.ini");
  const std::string state = home.path(".local/state/com.quennel.Orvane2/");
  const std::string logs = home.path("Library/Logs/com.quennel.Orvane2/");
  const std::vector<std::string> scan = {"scan", "--analytics", "https://127.0.0.1:1",
                                         folder.path()};

  nlohmann::json show() { return nlohmann::json::parse(run({"data", "show", "--json"}).output); }
  nlohmann::json exported() { return nlohmann::json::parse(run({"data", "export"}).output); }
  nlohmann::json identifier() { return show()["clientIdentifier"]; }

  /// Something of each kind.
  void keepAll() {
    folder.write("a", "same");
    folder.write("b", "same");
    folder.write("c\xff", "same");
    run({"analytics", "consent", "yes"});
    run(scan);
    run({"remind", "every", "weekly"});
    EXPECT_EQ(run({"trash", "--keep", "oldest", "--yes", folder.path()}).status, 0);
  }

  std::set<std::string> filesBelow(const std::vector<std::string>& folders) const {
    std::set<std::string> files;
    for (const std::string& each : folders)
      if (fs::exists(each))
        for (const auto& entry : fs::directory_iterator(each)) files.insert(entry.path());
    return files;
  }
  std::set<std::string> allFiles() const {
    return filesBelow({home.path(".config/com.quennel.Orvane2"), state, logs});
  }
};

TEST_F(OrvaneData, HasARandomIdentifierOnlyWithConsent) {
  auto printing = scan;
  printing.push_back("--print-events");
  const auto printed = [&] {
    const std::string errors = run(printing).errors;
    const std::size_t start = errors.find("Optional(\"") + 10;
    return errors.substr(start, errors.find('"', start) - start);
  };
  EXPECT_NE(printed(), printed()) << "nobody is known by it";
  EXPECT_FALSE(fs::exists(settings));
  run({"analytics", "consent", "yes"});
  EXPECT_EQ(identifier(), nullptr);
  const std::string first = printed();
  EXPECT_THAT(first, ::testing::MatchesRegex("[0-9A-F-]{36}"));
  EXPECT_EQ(printed(), first);
  EXPECT_EQ(identifier(), first);
  EXPECT_THAT(exported()["events"].dump(), HasSubstr("cid=" + first));

  // What waits would tell whose the next one is.
  EXPECT_EQ(run({"analytics", "reset"}).output, "consent: yes\n");
  EXPECT_EQ(identifier(), nullptr);
  const std::string second = printed();
  EXPECT_NE(second, first);
  EXPECT_THAT(exported()["events"].dump(), AllOf(HasSubstr(second), Not(HasSubstr(first))));
  run({"analytics", "consent", "no"});
  EXPECT_EQ(identifier(), nullptr);
  // One that was drawn with the consent, and kept once that was taken back by another process.
  std::ofstream(settings, std::ios::app) << "analyticsClientIdentifier=late\n";
  EXPECT_EQ(identifier(), "late");
  run(scan);
  EXPECT_EQ(identifier(), nullptr);
}

TEST_F(OrvaneData, ShowsAndErasesAllThatItKeeps) {
  EXPECT_THAT(run({"data", "erase", "--yes"}).output, HasSubstr("settings: none\n"));
  EXPECT_THAT(allFiles(), IsEmpty()) << "looking makes no files";
  keepAll();
  std::set<std::string> told;
  const nlohmann::json shown = show();
  for (const auto& part : shown["parts"])
    for (const auto& file : part["files"]) told.insert(file);
  EXPECT_EQ(told, allFiles());
  const nlohmann::json all = exported();
  EXPECT_THAT(all["settings"].dump(), HasSubstr("analyticsConsent=true"));
  const auto& moved = all["removals"][0]["tables"]["files"];
  EXPECT_EQ(moved[0]["path"], folder.path("b"));
  EXPECT_EQ(moved[0].count("pathBytes"), 0u);
  EXPECT_EQ(moved[1]["path"], folder.path("c\uFFFD"));
  EXPECT_THAT(moved[1]["pathBytes"], ::testing::EndsWith("2f63ff"));
  EXPECT_EQ(all["reminders"][0]["tables"]["deliveries"][0]["state"], "planned");
  EXPECT_THAT(all["logs"][0]["text"], HasSubstr("Will scan"));

  const auto before = allFiles();
  EXPECT_THAT(run({"data", "erase"}).output, HasSubstr("--yes does it"));
  EXPECT_EQ(allFiles(), before);
  const std::string another = home.path(".config/com.quennel.Another/settings.ini");
  fs::create_directories(fs::path(another).parent_path());
  home.write(".config/com.quennel.Another/settings.ini", "[Defaults]\n");
  home.write(".local/state/com.quennel.Orvane2/notes.sqlite", "the user's");
  fs::create_symlink(another, logs + "2020-01-01.log");
  const Outcome erased = run({"data", "erase", "--yes"});
  EXPECT_EQ(erased.status, 3);
  EXPECT_THAT(erased.output,
              AllOf(HasSubstr("settings: erased, "), HasSubstr("events: erased, "),
                    HasSubstr("removals: erased, "), HasSubstr("reminders: erased, "),
                    HasSubstr("2020-01-01.log: is a link\n")));
  EXPECT_EQ(allFiles(), (std::set<std::string>{state + "notes.sqlite", logs + "2020-01-01.log"}));
  EXPECT_TRUE(fs::exists(another));
  fs::remove(logs + "2020-01-01.log");
  EXPECT_THAT(run({"data", "erase", "--yes"}).output, HasSubstr("it holds other files"));
  EXPECT_THAT(run({"remind", "status"}).output, Not(HasSubstr("scheduled")));
  EXPECT_EQ(run({"restore", "--list"}).output, "");
}

TEST_F(OrvaneData, LeavesWhatLiesInThePlaceOfItsFolders) {
  const std::string file = home.write("file", "the user's");
  const std::string log = home.write("target/2020-01-01.log", "the user's");
  const fs::path folders[] = {fs::path(settings).parent_path(), fs::path(state).parent_path(),
                              fs::path(logs).parent_path()};
  for (const bool isLink : {true, false}) {
    for (const fs::path& each : folders) {
      fs::remove(each);
      fs::create_directories(each.parent_path());
      if (isLink) fs::create_directory_symlink(fs::path(log).parent_path(), each);
      if (!isLink) fs::copy_file(file, each);
    }
    if (isLink) run({"analytics", "consent", "yes"});
    const char* const objection = isLink ? " is a link\n" : " is no folder\n";
    EXPECT_THAT(run({"data", "show"}).output,
                HasSubstr("com.quennel.Orvane2" + std::string(objection)));
    const Outcome erased = run({"data", "erase", "--yes"});
    EXPECT_EQ(erased.status, 3);
    EXPECT_THAT(erased.output, AllOf(HasSubstr("logs: left "),
                                     HasSubstr(isLink ? "settings: erased" : "settings: none")));
    for (const fs::path& each : folders) EXPECT_EQ(fs::is_symlink(each), isLink) << each;
    for (const fs::path& each : folders) EXPECT_TRUE(fs::exists(each)) << each;
    EXPECT_TRUE(fs::exists(log));
  }
}

// Whoever is at work goes on; whoever has a file open brings nothing back.
TEST_F(OrvaneData, LeavesToOthersWhatTheyAreAtWorkWith) {
  keepAll();
  const auto& ports = Varnel::Platform::processPorts();
  const std::string path = state + "removals.sqlite";
  RemovalJournal journal({ports.privateFiles, ports.systemLog}, path);
  for (const std::string& lock : {settings + ".lock", path + ".removing", path + ".opening"}) {
    const auto held = ports.privateFiles.get().tryLock(lock);
    ASSERT_TRUE(held && *held) << lock;
    const Outcome outcome = run({"data", "erase", "--yes"});
    EXPECT_EQ(outcome.status, 3);
    EXPECT_THAT(outcome.output, HasSubstr("another process is at work with it\n"));
    EXPECT_TRUE(fs::exists(lock == settings + ".lock" ? settings : path)) << lock;
    if (lock == settings + ".lock") keepAll();
  }
  ASSERT_FALSE(journal.removals()->empty());
  EXPECT_THAT(run({"data", "erase", "--yes"}).output, HasSubstr("what was in it is gone\n"));
  EXPECT_TRUE(journal.removals()->empty());
  EXPECT_THAT(read(path) + read(path + "-wal"), Not(HasSubstr(folder.path())));
}

// Root may run with the home of somebody else.
TEST_F(OrvaneData, TouchesNothingOfAnotherUser) {
  keepAll();
  std::ofstream(logs + "2020-01-01.log") << "x";
  fs::last_write_time(logs + "2020-01-01.log",
                      fs::file_time_type::clock::now() - std::chrono::days(31));
  const auto files = allFiles();
  for (const std::string& each : files)
    if (::chown(each.c_str(), 1234, static_cast<gid_t>(-1)) != 0) GTEST_SKIP() << "not root";
  for (const std::string& each : {settings, state, logs})
    ASSERT_EQ(::chown(fs::path(each).parent_path().c_str(), 1234, static_cast<gid_t>(-1)), 0);
  EXPECT_EQ(run({"data", "erase", "--yes"}).status, 3);
  EXPECT_EQ(allFiles(), files);
  for (const std::string& each : files) fs::remove(each);
  EXPECT_THAT(run({"data", "erase", "--yes"}).output, HasSubstr("it belongs to somebody else"));
  for (const std::string& each : {settings, state, logs})
    EXPECT_TRUE(fs::exists(fs::path(each).parent_path())) << each;
}

TEST_F(OrvaneData, RemovesLogsThirtyDaysAfterTheirLastEntry) {
  run({"scan", folder.path()});
  const std::string target = home.write("target", "not a log");
  fs::create_symlink(target, logs + "2020-01-03.log");
  fs::create_directory(logs + "2020-01-04.log");
  const struct {
    const char* name;
    int days;
    bool stays;
  } cases[] = {{"2020-01-01.log", 31, false}, {"2020-01-02.log", 29, true},
               {"2020-01-03.log", 31, true},  {"2020-01-04.log", 31, true},
               {"notes.log", 31, true},       {"2020-01-01.log.gz", 31, true}};
  for (const auto& each : cases) {
    const std::string path = logs + each.name;
    if (!fs::exists(path)) std::ofstream(path) << "x";
    fs::last_write_time(path, fs::file_time_type::clock::now() - std::chrono::days(each.days));
  }
  run({"path", "/"});
  for (const auto& each : cases) EXPECT_EQ(fs::exists(logs + each.name), each.stays) << each.name;
}

}  // namespace
}  // namespace Orvane::Testing
