// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Generic/NotificationStore.h>

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <signal.h>
#include <sys/wait.h>
#include <unistd.h>

#include <array>
#include <atomic>
#include <barrier>
#include <fstream>
#include <thread>

#include <Tests/Support/TemporaryFolder.h>
#include <Tests/Support/Zones.h>
#include <Varnel/Platform/Testing/CapturedOutput.h>
#include <Varnel/Platform/Text/Calendar.h>

namespace Varnel::Platform {
namespace {

namespace fs = std::filesystem;
using namespace std::chrono_literals;
using ::testing::HasSubstr;
using ::testing::IsEmpty;
using ::testing::SizeIs;

const auto zones = Tests::zonesOf2026();
constexpr Date start = std::chrono::sys_days(std::chrono::year(2026) / 3 / 1);

class NotificationStoreTest : public ::testing::Test {
 protected:
  UserNotification weekly(const char* identifier = "weekly") const {
    return {.identifier = identifier,
            .title = "Title",
            .informativeText = "Text\xff & <b>",
            .actionButtonTitle = "Do",
            .otherButtonTitle = "",
            .deliveryDate = start,
            .deliveryRepeatInterval = DateComponents{.day = 7}};
  }

  const Tests::TemporaryFolder folder;
  const fs::path file = folder.path() / "made" / "store.sqlite";
  const Calendar calendar{"en_US", "UTC", zones};
  Testing::CapturedSystemLog log;
};

TEST_F(NotificationStoreTest, KeepsEveryPartOfANotificationForTheNextRun) {
  {
    NotificationStore store(file, log);
    store.schedule(weekly(), start, calendar);
    store.schedule({.title = "Nameless"}, start, calendar);
    store.schedule({.title = "Nameless"}, start, calendar);
  }
  NotificationStore store(file, log);
  const auto schedules = store.schedules();
  ASSERT_THAT(schedules, SizeIs(3));
  EXPECT_EQ(schedules[0].notification, weekly());
  EXPECT_EQ(schedules[0].timeZone, "UTC");
  EXPECT_EQ(fs::status(file).permissions(), fs::perms::owner_read | fs::perms::owner_write);
  EXPECT_EQ(fs::status(file.parent_path()).permissions(), fs::perms::owner_all);

  const auto claimed = store.claimDue(start, calendar);
  ASSERT_THAT(claimed, SizeIs(3));
  auto expected = weekly();
  expected.actualDeliveryDate = start;
  EXPECT_EQ(store.delivered().back().notification, expected);
  EXPECT_THAT(store.schedules(), SizeIs(1));
  EXPECT_EQ(log.text(), "");
}

TEST_F(NotificationStoreTest, EachDeliveryIsClaimedOnceAmongMany) {
  constexpr int claimerCount = 4;
  constexpr int weekCount = 15;
  NotificationStore(file, log).schedule(weekly(), start, calendar);
  std::array<std::atomic<int>, weekCount> claims{};
  std::barrier step(claimerCount);
  const auto claimAll = [&] {
    NotificationStore store(file, log);  // What a process has of its own.
    const Calendar own("en_US", "UTC", zones);
    for (int week = 0; week < weekCount; ++week) {
      step.arrive_and_wait();
      claims.at(static_cast<std::size_t>(week)) +=
          static_cast<int>(store.claimDue(start + std::chrono::days(7 * week), own).size());
    }
  };
  {
    std::vector<std::jthread> claimers;
    for (int i = 0; i < claimerCount; ++i) claimers.emplace_back(claimAll);
  }
  for (const auto& count : claims) EXPECT_EQ(count, 1);
  EXPECT_EQ(log.text(), "");
}

TEST_F(NotificationStoreTest, SetsADamagedFileAsideAndGoesOn) {
  const auto damaged = [&] { return file.string() + ".damaged"; };
  for (const std::string& content :
       {std::string(4096, 'x'),
        std::string("SQLite format 3\0\x10\0\1\1\0\x40\x20\x20garbage", 31) +
            std::string(8000, 'z')}) {
    fs::create_directories(file.parent_path());
    std::ofstream(file, std::ios::binary) << content;
    NotificationStore store(file, log);
    store.schedule(weekly(), start, calendar);
    EXPECT_THAT(store.schedules(), SizeIs(1));
    EXPECT_EQ(fs::file_size(damaged()), content.size());
    fs::remove(file);
  }
  EXPECT_THAT(log.text(),
              HasSubstr("Set aside the damaged store of notifications as " + damaged()));

  // A sound database with other tables.
  {
    auto other = SQLiteDatabase::open(file.string());
    ASSERT_FALSE(other->execute("CREATE TABLE scheduled (key TEXT)"));
  }
  NotificationStore store(file, log);
  store.schedule(weekly(), start, calendar);
  EXPECT_THAT(store.schedules(), SizeIs(1));

  // Damage done while it is open.
  { std::ofstream(file, std::ios::binary | std::ios::trunc) << std::string(20'000, 'y'); }
  store.schedule(weekly("again"), start, calendar);
  EXPECT_THAT(NotificationStore(file, log).schedules(), SizeIs(1));
}

TEST_F(NotificationStoreTest, FollowsAFileThatIsReplacedWhileItIsOpen) {
  NotificationStore store(file, log);
  store.schedule(weekly(), start, calendar);
  fs::rename(file, file.string() + ".damaged");  // As another process sets it aside.
  NotificationStore other(file, log);
  other.schedule(weekly("other"), start, calendar);
  ASSERT_THAT(store.schedules(), SizeIs(1));
  EXPECT_EQ(store.schedules().front().notification.identifier, "other");
  EXPECT_EQ(store.claimDue(start, calendar).size() + other.claimDue(start, calendar).size(), 1u);
  fs::remove(file);
  store.schedule(weekly(), start, calendar);
  EXPECT_THAT(other.schedules(), SizeIs(1));
  EXPECT_EQ(log.text(), "");
}

TEST_F(NotificationStoreTest, AFileThatIsLockedForLongIsTriedAgain) {
  NotificationStore(file, log).schedule(weekly(), start, calendar);
  NotificationStore store(file, log);
  auto holder = SQLiteDatabase::open(file.string());
  ASSERT_FALSE(holder->execute("BEGIN EXCLUSIVE"));
  EXPECT_THAT(store.schedules(), IsEmpty());
  EXPECT_TRUE(store.isOutOfOrder());
  ASSERT_FALSE(holder->execute("COMMIT"));
  EXPECT_THAT(store.schedules(), SizeIs(1));
  EXPECT_FALSE(store.isOutOfOrder());
  EXPECT_FALSE(fs::exists(file.string() + ".damaged"));
}

TEST_F(NotificationStoreTest, AKilledProcessLosesNothingAndLocksNobodyOut) {
  const pid_t process = ::fork();
  ASSERT_GE(process, 0);
  if (process == 0) {
    NotificationStore(file, log).schedule(weekly(), start, calendar);
    auto database = SQLiteDatabase::open(file.string());
    static_cast<void>(database->execute("BEGIN EXCLUSIVE; DELETE FROM scheduled"));
    ::kill(::getpid(), SIGKILL);
  }
  int status = 0;
  ASSERT_EQ(::waitpid(process, &status, 0), process);
  ASSERT_TRUE(WIFSIGNALED(status));
  EXPECT_THAT(NotificationStore(file, log).claimDue(start, calendar), SizeIs(1));
  EXPECT_EQ(log.text(), "");
}

TEST_F(NotificationStoreTest, ServesFromMemoryWhereNoFileCanBe) {
  std::ofstream(folder.path() / "made") << "a file where the folder should be";
  NotificationStore store(file, log);
  store.schedule(weekly(), start, calendar);
  EXPECT_THAT(store.claimDue(start, calendar), SizeIs(1));
  EXPECT_THAT(log.text(), HasSubstr("Notifications are kept in memory alone"));
}

TEST_F(NotificationStoreTest, SurvivesWhateverStandsInItsColumns) {
  NotificationStore(file, log).schedule(weekly(), start, calendar);
  {
    auto database = SQLiteDatabase::open(file.string());
    for (const char* sql :
         {"UPDATE scheduled SET date = 9223372036854775807, months = -1, days = 'x', zone = 'A/B'",
          "INSERT INTO scheduled (key, date, years, zone, count) VALUES "
          "('a', -9223372036854775807, 9223372036854775807, '', 9223372036854775807)",
          "INSERT INTO scheduled (key, date, days, zone, count) VALUES ('b', 'x', 1, x'ff', -9)",
          "INSERT INTO delivered (key, title, delivered) VALUES ('c', x'00ff', 'never')"})
      ASSERT_FALSE(database->execute(sql)) << sql;
  }
  NotificationStore store(file, log);
  const auto claimed = store.claimDue(start, Calendar("en_US", "Europe/Berlin", zones));
  EXPECT_THAT(store.schedules(), SizeIs(testing::Le(3u)));
  EXPECT_THAT(store.delivered(), SizeIs(1 + claimed.size()));
}

TEST_F(NotificationStoreTest, KeepsTheLatestHundredDelivered) {
  NotificationStore store(file, log);
  for (int i = 0; i < 103; ++i)
    static_cast<void>(store.addDelivered({.title = std::to_string(i)}, start + i * 1s));
  const auto delivered = store.delivered();
  ASSERT_THAT(delivered, SizeIs(100));
  EXPECT_EQ(delivered.front().notification.title, "102");
  EXPECT_EQ(delivered.back().notification.title, "3");
}

}  // namespace
}  // namespace Varnel::Platform
