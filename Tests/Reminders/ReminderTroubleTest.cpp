// SPDX-License-Identifier: MIT
// What the user sees, and what is left, when the store of notifications cannot be used.
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/mount.h>
#include <unistd.h>

#include <filesystem>
#include <fstream>
#include <functional>
#include <optional>
#include <string>

#include <Tests/Reminders/CenterProcess.h>
#include <Tests/Support/AsUser.h>
#include <Tests/Support/ChildProcess.h>
#include <Tests/Support/TemporaryFolder.h>
#include <Varnel/Platform/Ports/ReadFile.h>
#include <Varnel/Platform/SQLite/SQLiteDatabase.h>

namespace Varnel::Platform {
namespace {

namespace fs = std::filesystem;
using namespace std::chrono_literals;
using ::testing::AllOf;
using ::testing::ContainsRegex;
using ::testing::HasSubstr;
using ::testing::IsEmpty;
using ::testing::Not;
using ::testing::SizeIs;

constexpr Date start = std::chrono::sys_days(std::chrono::year(2026) / 3 / 1);
constexpr auto week = std::chrono::days(7);

// A user's home folder.
class Home final {
 public:
  explicit Home(uid_t user) {
    fs::create_directories(state);
    fs::permissions(state, fs::perms::owner_all);
    for (fs::path made = state; made != folder.path(); made = made.parent_path())
      Tests::give(made, user);
    Tests::give(folder.path(), user);
  }

  int orvane(const std::string& arguments) {
    const int status =
        Tests::ChildProcess(
            {"/usr/bin/env", "-i", "HOME=" + folder.path().string(), "/bin/sh", "-c",
             "exec " ORVANE_PROGRAM " " + arguments + " >$HOME/output 2>$HOME/errors"})
            .wait();
    output = readFile(folder.path() / "output").valueOr("");
    errors = readFile(folder.path() / "errors").valueOr("");
    return status;
  }
  void sql(const std::string& statements) const {
    auto database = SQLiteDatabase::open(store.string());
    EXPECT_FALSE(database->execute(statements));
  }

  // An ordinary user cannot remount, and root can write whatever the mode is.
  void protect(bool isOn) const {
    if (::mount("", state.c_str(), nullptr, MS_REMOUNT | (isOn ? MS_RDONLY : 0), "") == 0) return;
    if (!isOn) fs::permissions(state, fs::perms(0700));
    for (const auto& file : fs::directory_iterator(state))
      fs::permissions(file, fs::perms(isOn ? 0400 : 0600));
    if (isOn) fs::permissions(state, fs::perms(0500));
  }

  const Tests::TemporaryFolder folder;
  const fs::path state = folder.path() / ".local" / "state" / "com.quennel.Orvane2";
  const fs::path store = state / "notifications.sqlite";
  const fs::path aside = folder.path() / "aside";
  std::optional<SQLiteDatabase> lock;
  std::string output, errors;
};

struct Trouble {
  std::string name;
  std::function<void(Home&)> begin, end;
  const char* complaint;
  enum { waits, isLeftAlone, isReplaced } store = waits;
  enum { none, ofRoot, ofAll } needsDisk = none;  // One of its own.

  friend void PrintTo(const Trouble& trouble, std::ostream* out) { *out << trouble.name; }
};

const Trouble troubles[] = {
    {"locked",
     [](Home& home) {
       home.lock = std::move(*SQLiteDatabase::open(home.store.string()));
       EXPECT_FALSE(home.lock->execute("BEGIN EXCLUSIVE"));
     },
     [](Home& home) { home.lock.reset(); }, "database is locked"},
    {"full disk",
     [](Home& home) {
       std::ofstream filler(home.state / "filler", std::ios::binary);
       while (filler << std::string(1024, 'x') << std::flush) continue;
     },
     [](Home& home) { fs::remove(home.state / "filler"); }, "full", Trouble::waits, Trouble::ofAll},
    {"read-only", [](Home& home) { home.protect(true); }, [](Home& home) { home.protect(false); },
     "ead|Permission denied", Trouble::waits, Trouble::ofRoot},
    {"a link",
     [](Home& home) {
       fs::copy(home.store, home.aside);
       fs::remove(home.store);
       fs::create_symlink(home.aside, home.store);
     },
     [](Home& home) {
       fs::remove(home.store);
       fs::copy(home.aside, home.store);
     },
     "is a link", Trouble::isLeftAlone},
    {"another's file", [](Home& home) { home.sql("PRAGMA application_id = 7"); },
     [](Home& home) { home.sql("PRAGMA application_id = 1447980916"); },
     "belongs to another application", Trouble::isLeftAlone},
    {"a newer format", [](Home& home) { home.sql("PRAGMA user_version = 2000"); },
     [](Home& home) { home.sql("PRAGMA user_version = 1001"); }, "the file's format is 2.0",
     Trouble::isLeftAlone},
    {"damage",
     [](Home& home) { std::ofstream(home.store, std::ios::binary) << std::string(20'000, 'y'); },
     [](Home&) {}, "", Trouble::isReplaced},
};

// The program says so with its status, keeps the period, and the next one plans it.
void orvaneSaysSo(Home& home, const Trouble& trouble) {
  ASSERT_EQ(home.orvane("remind every weekly"), 0) << home.errors;
  trouble.begin(home);
  // To open and close a locked file would free it.
  const bool isLeftAlone = trouble.store == Trouble::isLeftAlone;
  const std::string before = isLeftAlone ? readFile(home.store).valueOr("") : "";
  const bool isReplaced = trouble.store == Trouble::isReplaced;
  // Also where the plan of before is one of the same period. The program waits a while for the
  // store, so one user tries the one, and the other the other.
  const bool isSame = ::getuid() == 0;
  const int status = home.orvane(isSame ? "remind every weekly" : "remind every monthly");
  EXPECT_EQ(status, isReplaced ? 0 : 1);
  EXPECT_THAT(home.errors, HasSubstr(isReplaced ? "" : "orvane: the "));
  EXPECT_THAT(home.errors, ContainsRegex(trouble.complaint));
  EXPECT_EQ(fs::exists(home.store.string() + ".damaged"), isReplaced);
  if (isLeftAlone) {
    EXPECT_TRUE(readFile(home.store).valueOr("") == before);
  }
  trouble.end(home);
  const auto saysSo = HasSubstr("the plan is not that of the period");
  EXPECT_EQ(home.orvane("remind status"), 0);
  EXPECT_EQ(testing::Matches(saysSo)(home.errors), !isReplaced && !isSame) << home.errors;
  EXPECT_EQ(home.orvane("remind tomorrow --found 1 --selected 0"), 0) << home.errors;
  EXPECT_THAT(home.output,
              AllOf(HasSubstr(isSame ? "period: Every Week\n" : "period: Every Month\n"),
                    HasSubstr("  SchedulerNotification: ")));
  EXPECT_EQ(home.orvane("remind status"), 0);
  EXPECT_THAT(home.errors, Not(saysSo));
}

// A banner that is due in a bad moment comes after it, once.
void whatIsDueComesLater(Home& home, const Trouble& trouble) {
  Testing::Process(home.store, start)
      .schedule({.identifier = "weekly",
                 .title = "Week",
                 .deliveryDate = start + week,
                 .deliveryRepeatInterval = DateComponents{.day = 7}});
  trouble.begin(home);
  Testing::Process process(home.store, start + week);
  process.listen();
  process.timer.advanceTo(start + week + 1min);
  EXPECT_THAT(process.server.history(), IsEmpty());
  // A list that cannot be read is not an empty one.
  const bool isKnown = process.center.scheduledNotifications().hasValue();
  if (trouble.store == Trouble::isReplaced) {
    EXPECT_TRUE(isKnown);
    EXPECT_THAT(process.scheduled(), IsEmpty());
    return;
  }
  EXPECT_TRUE(!isKnown || process.scheduled().size() == 1);
  EXPECT_THAT(process.log.text(), ContainsRegex(trouble.complaint));
  EXPECT_THAT(process.log.text(), Not(IsEmpty()));
  trouble.end(home);
  for (auto date = start + week + 2min; date < start + 2 * week; date += 12h) {
    process.timer.advanceTo(date);
    process.settle();
  }
  EXPECT_THAT(process.server.history(), SizeIs(1));
  EXPECT_EQ(process.timer.armedDate(), start + 2 * week);
}

using Scene = std::function<void(Home&, const Trouble&)>;

class ReminderTrouble : public ::testing::TestWithParam<Trouble> {
 protected:
  // As this user and, where that is root, as an ordinary one too.
  static void play(const Scene& scene) {
    for (const uid_t user : Tests::users()) {
      Home home(user);
      const Trouble& trouble = GetParam();
      const bool needsDisk = trouble.needsDisk >= (user == 0 ? Trouble::ofRoot : Trouble::ofAll);
      if (!Tests::inChild(
              user, [&] { scene(home, trouble); }, needsDisk ? home.state : fs::path()))
        GTEST_SKIP() << "no file system in memory";
    }
  }
};

INSTANTIATE_TEST_SUITE_P(, ReminderTrouble, ::testing::ValuesIn(troubles), [](const auto& one) {
  std::string name = one.param.name;
  std::erase_if(name, [](char c) { return !std::isalnum(static_cast<unsigned char>(c)); });
  return name;
});

TEST_P(ReminderTrouble, OrvaneSaysSoAndTheNextCommandPlans) {
  play(orvaneSaysSo);
}

TEST_P(ReminderTrouble, WhatIsDueComesLater) {
  play(whatIsDueComesLater);
}

}  // namespace
}  // namespace Varnel::Platform
