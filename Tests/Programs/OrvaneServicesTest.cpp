// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>
#include <sys/stat.h>
#include <sys/xattr.h>
#include <unistd.h>

#include <filesystem>
#include <fstream>
#include <nlohmann/json.hpp>
#include <string>
#include <vector>

#include <Tests/Programs/OrvaneFixture.h>

namespace Orvane::Testing {
namespace {

using ::testing::AllOf;
using ::testing::EndsWith;
using ::testing::HasSubstr;
using ::testing::IsEmpty;
using ::testing::Not;
using ::testing::StartsWith;

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
  if (library.extension() == ".a") GTEST_SKIP() << "The program contains the library.";
  const fs::path modules = folder.path("lib/" VARNEL_MODULES_NAME);
  fs::create_directories(modules);
  fs::copy_file(library, modules.parent_path() / library.stem());  // libvarnel.so.0.1
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
  const nlohmann::json facts = {{"schemaVersion", 1},       {"file", file},
                                {"flags", "0083"},          {"date", "2021-01-14 08:25:36 UTC"},
                                {"agentName", "Bro\nwser"}, {"eventIdentifier", "E1"},
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

}  // namespace
}  // namespace Orvane::Testing
