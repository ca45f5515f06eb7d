// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Generic/NotificationStore.h>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <atomic>
#include <barrier>
#include <filesystem>
#include <memory>
#include <thread>

#include <Tests/Support/TemporaryFolder.h>
#include <Tests/Support/Zones.h>
#include <Varnel/Platform/POSIX/Adapters.h>
#include <Varnel/Platform/Ports/PrivateFiles.h>
#include <Varnel/Platform/Ports/ReadFile.h>
#include <Varnel/Platform/SQLite/SQLiteDatabase.h>
#include <Varnel/Platform/Testing/CapturedOutput.h>
#include <Varnel/Platform/Text/Calendar.h>

namespace Varnel::Platform {
namespace {

namespace fs = std::filesystem;
using namespace std::chrono_literals;
using enum DeliveryState;
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
  NotificationStore open() { return {{*files, log}, file.string(), Migrating::allowed}; }

  static std::vector<Delivery> all(NotificationStore& store) {
    return store.deliveries({planned, due, hidden, toShow, shown, expired, removed}).valueOr({});
  }
  static Delivery only(NotificationStore& store, DeliveryState state) {
    const auto found = store.deliveries({state});
    EXPECT_TRUE(found && found->size() == 1);
    return found && found->size() == 1 ? found->front() : Delivery();
  }
  // Due, and the delegate wants to show it.
  static Delivery madeToShow(NotificationStore& store, const UserNotification& notification,
                             Date now = start) {
    EXPECT_FALSE(store.makeDue(notification, now));
    const Delivery delivery = only(store, due);
    EXPECT_TRUE(store.decideDue({{delivery.number, true}}));
    return delivery;
  }

  const Tests::TemporaryFolder folder;
  const fs::path file = folder.path() / "made" / "store.sqlite";
  const Calendar calendar{"en_US", "UTC", zones};
  const std::unique_ptr<PrivateFiles> files = POSIX::makePrivateFiles();
  Testing::CapturedSystemLog log;
};

TEST_F(NotificationStoreTest, KeepsEveryPartOfANotificationForTheNextRun) {
  {
    NotificationStore store = open();
    EXPECT_FALSE(store.plan(weekly(), start, calendar));
    EXPECT_FALSE(store.plan({.title = "Nameless"}, start, calendar));
    EXPECT_FALSE(store.plan({.title = "Nameless"}, start, calendar));
    EXPECT_FALSE(store.plan(weekly(), start, calendar));
  }
  NotificationStore store = open();
  const auto schedules = all(store);
  ASSERT_THAT(schedules, SizeIs(3));
  const auto regular = std::find_if(schedules.begin(), schedules.end(), [](const Delivery& each) {
    return each.schedule.notification.identifier.has_value();
  });
  ASSERT_NE(regular, schedules.end());
  EXPECT_EQ(regular->schedule.notification, weekly());
  EXPECT_EQ(regular->schedule.timeZone, "UTC");

  EXPECT_FALSE(store.claimDue(start, calendar));
  EXPECT_THAT(*store.deliveries({due}), SizeIs(3));
  EXPECT_EQ(only(store, planned).schedule.deliveryCount, 1);
  auto expected = weekly();
  expected.actualDeliveryDate = start;
  const auto claimed = *store.deliveries({due});
  EXPECT_THAT(claimed, testing::Contains(testing::Truly([&](const Delivery& each) {
                return each.number == regular->number && each.schedule.notification == expected;
              })));
  EXPECT_EQ(log.text(), "");
}

// A change of the schema is a new format, which still reads this one.
TEST_F(NotificationStoreTest, ReadsItsFirstFormat) {
  const auto schemaOf = [](const fs::path& path) {
    auto database = *SQLiteDatabase::open(path.string());
    auto rows = *database.prepare("SELECT sql FROM sqlite_master ORDER BY name");
    std::string schema;
    while (*rows.step() == SQLiteStatement::Step::row) schema += *rows.text(0);
    return schema;
  };
  const fs::path fresh = folder.path() / "fresh.sqlite";
  EXPECT_TRUE(
      NotificationStore({*files, log}, fresh.string(), Migrating::allowed).deliveries({planned}));
  fs::create_directories(file.parent_path());
  {
    auto database = SQLiteDatabase::open(file.string());
    ASSERT_FALSE(database->execute(*readFile(VARNEL_TEST_GOLDEN)));
  }
  // A program that may not migrate it reads it as it is.
  NotificationStore visitor({*files, log}, file.string(), Migrating::never);
  EXPECT_EQ(*visitor.source(), std::nullopt);
  NotificationStore store = open();
  std::string found;
  for (const DeliveryState state : {planned, due, hidden, toShow, shown, expired, removed})
    found += only(store, state).schedule.notification.title.value_or("?");
  EXPECT_EQ(found, "ABCDEFG");
  EXPECT_EQ(only(store, planned).schedule.notification.deliveryRepeatInterval,
            DateComponents{.day = 7});
  EXPECT_EQ(only(store, shown).banner, "bus :1.5 7");
  EXPECT_EQ(schemaOf(file), schemaOf(fresh));
  EXPECT_EQ(log.text(), "");
}

TEST_F(NotificationStoreTest, EachDeliveryIsClaimedOnceAmongMany) {
  constexpr int claimerCount = 4;
  constexpr int weekCount = 15;
  {
    NotificationStore store = open();
    EXPECT_FALSE(store.plan(weekly(), start, calendar));
  }
  std::atomic<int> failures = 0;
  std::barrier step(claimerCount);
  const auto claimAll = [&] {
    NotificationStore store = open();  // What a process has of its own.
    const Calendar own("en_US", "UTC", zones);
    for (int week = 0; week < weekCount; ++week) {
      step.arrive_and_wait();
      // Somebody else may keep the file for longer than anybody waits.
      while (store.claimDue(start + std::chrono::days(7 * week), own)) ++failures;
    }
  };
  {
    std::vector<std::jthread> claimers;
    for (int i = 0; i < claimerCount; ++i) claimers.emplace_back(claimAll);
  }
  NotificationStore store = open();
  EXPECT_EQ(only(store, planned).schedule.deliveryCount, weekCount);
  EXPECT_THAT(*store.deliveries({due}), SizeIs(1));
}

TEST_F(NotificationStoreTest, ADeliveryGoesFromStateToState) {
  NotificationStore store = open();
  const Delivery first = madeToShow(store, weekly());
  EXPECT_EQ(only(store, toShow).number, first.number);
  EXPECT_TRUE(*store.noteShown(first.number, "banner 1"));
  EXPECT_TRUE(*store.noteShown(first.number, "banner 1"));  // As a work that is done again.
  EXPECT_EQ(only(store, shown).banner, "banner 1");
  EXPECT_TRUE(store.decideDue({{first.number, true}}));
  EXPECT_EQ(only(store, shown).number, first.number) << "it was decided already";

  // Its successor has a number of its own and inherits its banner, to replace it.
  const Delivery second = madeToShow(store, weekly(), start + 1h);
  EXPECT_THAT(all(store), SizeIs(1));
  EXPECT_NE(second.number, first.number);
  EXPECT_EQ(only(store, toShow).banner, "banner 1");
  EXPECT_FALSE(*store.noteShown(first.number, "late"));

  // Removed, it stays until its banner is gone.
  EXPECT_TRUE(*store.noteShown(second.number, "banner 2"));
  EXPECT_FALSE(store.remove(second.number));
  EXPECT_EQ(only(store, removed).banner, "banner 2");
  EXPECT_FALSE(*store.noteShown(second.number, "late"));
  EXPECT_FALSE(store.noteGone(second.number));
  EXPECT_THAT(all(store), IsEmpty());

  const Delivery third = madeToShow(store, weekly());
  EXPECT_TRUE(*store.noteShown(third.number, "banner 3"));
  EXPECT_FALSE(store.noteGone(third.number));
  EXPECT_EQ(only(store, expired).banner, std::nullopt);
  EXPECT_FALSE(store.makeDue(weekly(), start));
  EXPECT_TRUE(store.decideDue({{only(store, due).number, false}}));
  EXPECT_EQ(only(store, hidden).schedule.key, third.schedule.key);
  EXPECT_FALSE(store.remove(only(store, hidden).number));
  EXPECT_THAT(all(store), IsEmpty());
}

TEST_F(NotificationStoreTest, SurvivesWhateverStandsInItsColumns) {
  NotificationStore store = open();
  EXPECT_FALSE(store.plan(weekly(), start, calendar));
  {
    auto database = SQLiteDatabase::open(file.string());
    for (const char* sql :
         {"UPDATE deliveries SET date = 9223372036854775807, months = -1, days = 'x', zone = 'A/B'",
          "INSERT INTO deliveries (state, key, date, years, zone, count) VALUES "
          "('planned', 'a', -9223372036854775807, 9223372036854775807, '', 9223372036854775807)",
          "INSERT INTO deliveries (state, key, date, days, zone, count) VALUES "
          "('planned', 'b', 'x', 1, x'ff', -9)",
          "INSERT INTO deliveries (state, key, title, delivered, zone, count) VALUES "
          "('shown', 'c', x'00ff', 'never', '', 0), ('of a later version', 'd', '', 1, '', 0)"})
      ASSERT_FALSE(database->execute(sql)) << sql;
  }
  EXPECT_FALSE(store.claimDue(start, Calendar("en_US", "Europe/Berlin", zones)));
  EXPECT_THAT(*store.deliveries({planned}), SizeIs(testing::Le(3u)));
  EXPECT_THAT(*store.deliveries({shown}), SizeIs(1));
}

TEST_F(NotificationStoreTest, KeepsTheLatestHundredDeliveredAndAllThatAreToBeShown) {
  NotificationStore store = open();
  // Before the last one the clock is set back.
  for (int i = 0; i < 103; ++i) {
    EXPECT_FALSE(store.makeDue({.title = std::to_string(i)}, start + (i < 102 ? i * 1s : -1h)));
    EXPECT_TRUE(store.decideDue({{only(store, due).number, i < 2}}));
  }
  const auto delivered = *store.deliveries({hidden});
  ASSERT_THAT(delivered, SizeIs(100));
  EXPECT_EQ(delivered.front().schedule.notification.title, "102");
  EXPECT_EQ(delivered.back().schedule.notification.title, "3");
  EXPECT_THAT(*store.deliveries({toShow}), SizeIs(2));
}

}  // namespace
}  // namespace Varnel::Platform
