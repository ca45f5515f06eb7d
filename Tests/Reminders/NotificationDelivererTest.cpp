// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Generic/NotificationDeliverer.h>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <fstream>
#include <functional>
#include <map>
#include <optional>

#include <Tests/Reminders/CenterProcess.h>
#include <Tests/Support/TemporaryFolder.h>
#include <Varnel/Platform/SQLite/SQLiteDatabase.h>

namespace Varnel::Platform {
namespace {

using Duty = NotificationDeliverer::Duty;
using namespace std::chrono;
using namespace std::chrono_literals;
using ::testing::ElementsAre;
using ::testing::IsEmpty;
using ::testing::SizeIs;

constexpr Date start = sys_days(2026y / March / 1) + 8h;

// Answers when the test says so.
struct Hosts final : NotificationHosts {
  std::map<std::string, std::function<void(bool)>> questions;
  std::vector<std::string> delivered;
  std::vector<NotificationActivation> activated;

  void shouldPresent(const UserNotification& notification,
                     std::function<void(bool)> answer) override {
    questions[*notification.title] = std::move(answer);
  }
  void didDeliver(const UserNotification& notification) override {
    delivered.push_back(*notification.title);
  }
  void didActivate(const NotificationActivation& activation) override {
    activated.push_back(activation);
  }
};

// A deliverer that serves products whose processes come and go.
struct Notifier {
  Notifier(const std::filesystem::path& file, Date now) : clock(now) {
    deliverer.emplace(DelivererPorts{clock, locale, zones, queue, *files, log, server, timer},
                      file.string(), Migrating::never, hosts);
    deliverer->setDuty(Duty::everything);
  }

  void settle() {
    do server.report();
    while (queue.drain());
  }

  Testing::SimulatedClock clock;
  Testing::FakeUserLocale locale;
  Testing::FakeTimeZones zones = Tests::zonesOf2026();
  Testing::FakeMainQueue queue;
  const std::unique_ptr<PrivateFiles> files = POSIX::makePrivateFiles();
  Testing::CapturedSystemLog log;
  Testing::FakeNotificationServer server;
  Testing::FakeWallClockTimer timer{clock};
  Hosts hosts;
  std::optional<NotificationDeliverer> deliverer;
};

class NotificationDelivererTest : public ::testing::Test {
 protected:
  static UserNotification at(Date date, const std::string& title = "A") {
    return {.identifier = title, .title = title, .deliveryDate = date};
  }
  // How often the file was written.
  [[nodiscard]] std::uint32_t commits() const {
    std::ifstream stream(file, std::ios::binary);
    stream.seekg(24);
    std::uint32_t count = 0;
    for (int i = 0; i < 4; ++i) count = count << 8 | static_cast<std::uint32_t>(stream.get());
    return count;
  }

  const Tests::TemporaryFolder folder = Tests::TemporaryFolder::inMemory();
  const std::filesystem::path file = folder.path() / "store.sqlite";
  Testing::Process host{file, start};  ///< It plans, and listens only where a test says so.
};

TEST_F(NotificationDelivererTest, AHostHasTwoSecondsToAnswerAndIsToldOnce) {
  const struct {
    const char* name;
    std::function<void(Notifier&, Testing::Process&)> meanwhile;
    std::size_t shown, told;
  } rows[] = {
      {"no", [](auto& it, auto&) { it.hosts.questions.at("A")(false); }, 0, 1},
      {"twice",
       [](auto& it, auto&) {
         for (const bool yes : {true, false}) it.hosts.questions.at("A")(yes);
       },
       1, 1},
      {"never", [](auto& it, auto&) { it.timer.advanceTo(start + 1h + 2s); }, 1, 1},
      {"too late",
       [](auto& it, auto&) {
         it.timer.advanceTo(start + 1h + 2s);
         it.hosts.questions.at("A")(false);
       },
       1, 1},
      {"the clock is set back", [](auto& it, auto&) { it.timer.setClock(start); }, 1, 1},
      {"removed",
       [](auto& it, auto& process) {
         EXPECT_FALSE(process.center.removeDeliveredNotification({.identifier = "A"}));
         it.deliverer->recheck();
         it.hosts.questions.at("A")(true);
       },
       0, 0},
      {"ended",
       [](auto& it, auto&) {
         it.deliverer.reset();
         it.hosts.questions.at("A")(true);
       },
       0, 0},
  };
  for (const auto& row : rows) {
    const Tests::TemporaryFolder own = Tests::TemporaryFolder::inMemory();
    Testing::Process process(own.path() / "store.sqlite", start);
    process.schedule(at(start + 1h));
    Notifier notifier(own.path() / "store.sqlite", start);
    notifier.timer.advanceTo(start + 1h + 1s);
    EXPECT_THAT(notifier.server.history(), IsEmpty()) << row.name;
    row.meanwhile(notifier, process);
    notifier.settle();
    EXPECT_THAT(notifier.server.history(), SizeIs(row.shown)) << row.name;
    EXPECT_THAT(notifier.hosts.delivered, SizeIs(row.told)) << row.name;
  }
}

// A burst costs a write for what is claimed, one for what is decided, and one for each twenty
// banners.
TEST_F(NotificationDelivererTest, AThousandAtOnceAreWrittenTogether) {
  constexpr int count = 1000;
  EXPECT_FALSE(host.center.change([&] {
    for (int i = 0; i < count; ++i) host.schedule(at(start + 1h, std::to_string(i)));
    return std::nullopt;
  }));
  const std::uint32_t unwritten = commits();
  Notifier notifier(file, start + 1h);
  EXPECT_THAT(notifier.hosts.questions, SizeIs(count));
  for (const auto& [title, answer] : notifier.hosts.questions) answer(true);
  EXPECT_THAT(notifier.server.history(), IsEmpty());
  for (std::size_t before = 0; notifier.queue.drain(); before = notifier.server.history().size()) {
    EXPECT_LE(notifier.server.history().size(), before + NotificationDeliverer::maxOnTheirWay);
    notifier.server.report();
  }
  EXPECT_THAT(notifier.server.history(), SizeIs(count));
  EXPECT_EQ(notifier.server.count(), std::size_t{count});
  EXPECT_THAT(notifier.hosts.delivered, SizeIs(count));
  EXPECT_LE(commits() - unwritten, 2 + count / NotificationDeliverer::maxOnTheirWay);
}

TEST_F(NotificationDelivererTest, IsIdleWhenNothingIsLeftNowAndLater) {
  host.schedule(at(start + 1h));
  Notifier notifier(file, start);
  const auto isIdle = [&] {
    notifier.settle();
    return notifier.deliverer->isIdle();
  };
  EXPECT_FALSE(isIdle()) << "planned";
  EXPECT_EQ(notifier.deliverer->earliestDate(), start + 1h);
  notifier.timer.advanceTo(start + 1h);
  EXPECT_FALSE(isIdle()) << "due";
  EXPECT_FALSE(notifier.deliverer->isQuiet());
  notifier.server.isPresent = false;
  notifier.hosts.questions.at("A")(true);
  EXPECT_FALSE(isIdle()) << "to show";
  notifier.server.appear();
  EXPECT_FALSE(isIdle()) << "its banner is up";
  EXPECT_EQ(notifier.server.source, host.source);
  {
    Notifier next(file, start + 1h);
    next.settle();
    EXPECT_TRUE(next.deliverer->isIdle()) << "somebody else's banner";
  }
  notifier.server.activate("A", {.isActionButton = true, .activationToken = "token"});
  EXPECT_TRUE(isIdle()) << "clicked";
  ASSERT_THAT(notifier.hosts.activated, SizeIs(1));
  EXPECT_TRUE(notifier.hosts.activated.front().isActionButton);
  EXPECT_EQ(notifier.hosts.activated.front().notification.activationToken, "token");
  EXPECT_EQ(notifier.deliverer->earliestDate(), std::nullopt);
  // A store of another version is for another program.
  host.schedule(at(start + 2h));
  for (const char* version : {"2000", "0"}) {
    ASSERT_FALSE(SQLiteDatabase::open(file.string())
                     ->execute(std::string("PRAGMA user_version = ") + version));
    Notifier stranger(file, start + 3h);
    EXPECT_TRUE(stranger.deliverer->isIdle()) << version;
    EXPECT_THAT(stranger.hosts.questions, IsEmpty()) << version;
  }
}

TEST_F(NotificationDelivererTest, LeavesAProcessThatDeliversItselfAloneWhileItListens) {
  for (const bool ends : {false, true}) {
    std::optional<Testing::Process> other(std::in_place, file, start);
    other->listen();
    other->schedule(at(start, "its own"));  // Its banner has yet to come.
    Notifier notifier(file, start);
    for (const bool isTold : {true, false}) {
      host.schedule(at(start, isTold ? "told" : "not told"));
      notifier.deliverer->recheck();
      EXPECT_THAT(notifier.hosts.questions, IsEmpty()) << ends;
      if (isTold) continue;
      if (ends) {
        other.reset();
      } else {
        other->center.setDelegate({});
        other->settle();
      }
      notifier.timer.advanceTo(start + NotificationDeliverer::maxPause);
    }
    EXPECT_THAT(notifier.hosts.questions, SizeIs(2)) << ends;
  }
}

// One that is due for another process keeps the next one from nobody.
TEST_F(NotificationDelivererTest, WhatIsPlannedIsAwaitedWhateverIsInTheWay) {
  Testing::Process other(file, start);
  other.listen();
  other.deliver(at(start, "its own"));
  host.schedule(at(start));
  host.schedule(at(start + 500ms, "next"));
  const Notifier notifier(file, start);
  EXPECT_EQ(notifier.deliverer->earliestDate(), start + 500ms);
}

TEST_F(NotificationDelivererTest, TheBannerOfAnEarlierOneIsKnownUntilItIsClosed) {
  NotificationStore store({*host.realFiles, host.log}, file.string(), Migrating::never);
  host.schedule(at(start));
  {
    Notifier earlier(file, start);
    earlier.hosts.questions.at("A")(true);
    earlier.settle();
    EXPECT_THAT(*store.deliveries({DeliveryState::shown}), SizeIs(1));
  }
  host.schedule(at(start, "B"));
  Notifier notifier(file, start);
  const auto expired = store.deliveries({DeliveryState::expired});
  ASSERT_THAT(*expired, SizeIs(1));
  EXPECT_TRUE(expired->front().banner);
  // The next A is hidden, and the server does not close the banner.
  host.schedule(at(start));
  notifier.deliverer->recheck();
  notifier.server.faults->plan(Testing::Fault::fails, 1, 1);
  for (const char* const title : {"A", "B"}) notifier.hosts.questions.at(title)(false);
  notifier.settle();
  EXPECT_FALSE(notifier.deliverer->isIdle());
  EXPECT_TRUE(notifier.deliverer->isQuiet());
  notifier.server.appear();
  notifier.settle();
  EXPECT_TRUE(notifier.deliverer->isIdle());
}

TEST_F(NotificationDelivererTest, ALockedStoreIsSpokenOfWhenItLasts) {
  host.schedule(at(start + 1h));
  Notifier notifier(file, start);
  auto holder = SQLiteDatabase::open(file.string());
  for (const bool lasts : {false, true}) {
    ASSERT_FALSE(holder->execute("BEGIN EXCLUSIVE"));
    notifier.deliverer->recheck();
    EXPECT_EQ(notifier.log.text(), "");
    if (lasts) notifier.timer.advanceTo(start + 2 * NotificationDeliverer::minPause);
    ASSERT_FALSE(holder->execute("COMMIT"));
    notifier.timer.advanceTo(notifier.clock.now() + NotificationDeliverer::minPause);
  }
  EXPECT_EQ(notifier.log.text(), "Notifications have to wait: database is locked\n");
}

TEST_F(NotificationDelivererTest, AStoreThatTheUserRemovesStaysRemoved) {
  host.schedule(at(start));
  host.schedule(at(start + 1h, "old"));
  Notifier notifier(file, start);
  notifier.hosts.questions.at("A")(true);
  notifier.settle();
  ASSERT_EQ(notifier.server.count(), 1u);
  std::filesystem::remove(file);
  notifier.timer.advanceTo(start + 1h);
  EXPECT_FALSE(notifier.deliverer->keepLaunch({at(start)}));
  notifier.settle();
  EXPECT_TRUE(notifier.deliverer->isIdle());
  EXPECT_EQ(notifier.deliverer->earliestDate(), std::nullopt);
  EXPECT_EQ(notifier.server.count(), 0u);
  EXPECT_FALSE(std::filesystem::exists(file));
  Testing::Process(file, start + 1h).schedule(at(start + 2h, "new"));
  notifier.deliverer->recheck();
  notifier.timer.advanceTo(start + 2h);
  EXPECT_THAT(notifier.hosts.questions, SizeIs(2)) << "that of A, and of the new one";
}

TEST_F(NotificationDelivererTest, KeepsAClickForOneStartOnly) {
  host.schedule(at(start + 1h));
  Notifier notifier(file, start);
  const UserNotification clicked = at(start);
  EXPECT_FALSE(notifier.deliverer->keepLaunch({clicked}));
  notifier.clock.advance(1s);
  EXPECT_FALSE(notifier.deliverer->keepLaunch({at(start, "B")}));
  Testing::Process other(file, start + 1s);
  EXPECT_EQ((*other.center.takeLaunchNotification())->title, "A");
  EXPECT_EQ((*host.center.takeLaunchNotification())->title, "B");
  EXPECT_EQ(*other.center.takeLaunchNotification(), std::nullopt);
  // One that was kept before the clock was set back is of another time.
  EXPECT_FALSE(notifier.deliverer->keepLaunch({clicked}));
  Testing::Process later(file, start - 1h);
  EXPECT_EQ(*later.center.takeLaunchNotification(), std::nullopt);
}

TEST_F(NotificationDelivererTest, KnowsWhomAClickStartsThoughTheStoreIsLocked) {
  host.schedule(at(start));
  Notifier notifier(file, start);
  notifier.hosts.questions.at("A")(true);
  notifier.settle();
  auto holder = SQLiteDatabase::open(file.string());
  ASSERT_FALSE(holder->execute("BEGIN EXCLUSIVE"));
  EXPECT_TRUE(notifier.deliverer->keepLaunch({at(start)}));
  EXPECT_EQ(notifier.deliverer->source().valueOr({}), host.source);
}

// Of two processes one is in front, and it is the other one that delivers.
TEST_F(NotificationDelivererTest, InFrontIsTheProductWhicheverOfItsProcessesIs) {
  Testing::Process other(file, start);
  host.listen();
  for (const auto active : {&host, &other, static_cast<Testing::Process*>(nullptr)}) {
    // The user goes to a window before the last one has noticed.
    for (auto* process : {&host, &other}) process->deliverer.setActive(true);
    for (auto* process : {&host, &other}) process->deliverer.setActive(process == active);
    host.listener->presents = active != &host;
    const std::size_t before = host.server.history().size();
    host.deliver({.title = "A"});
    EXPECT_EQ(host.server.history().size() - before, active ? 0u : 1u);
  }
}

}  // namespace
}  // namespace Varnel::Platform
