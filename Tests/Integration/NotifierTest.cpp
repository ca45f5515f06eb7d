// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <memory>
#include <optional>
#include <string>

#include <Tests/Integration/NotifierSession.h>
#include <Varnel/Platform/SQLite/SQLiteDatabase.h>

namespace Varnel::Tests {
namespace {

using ::testing::AllOf;
using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;
using ::testing::SizeIs;
TEST_F(NotifierTest, AReminderComesToAnApplicationThatDoesNotRunAndAClickStartsIt) {
  const std::string name = "com.example.StartOnAClick", example = VARNEL_EXAMPLE;
  ChildProcess analytics({VARNEL_ANALYTICS_SERVER, VARNEL_CERTIFICATE, "200"});
  addService(name, "/usr/bin/env HOME=" + home_ + " XDG_STATE_HOME=" + home_ + " " + example +
                       " serve http://127.0.0.1:" + analytics.readLine() + "/batch");
  write("share/applications/" + name + ".desktop",
        "[Desktop Entry]\nType=Application\nName=Example\nExec=" + example +
            " serve\nDBusActivatable=true\n");
  const Server server;
  constexpr int almostAWeek = 7 * 24 * 60 * 60 - 2;
  moveClock("+" + std::to_string(almostAWeek));
  EXPECT_EQ(ChildProcess({example, "plan"}).wait(), 0);
  const pid_t notifier = startedNotifier();
  EXPECT_TRUE(comesTrue([] { return displayed() == "1\n"; }));
  EXPECT_EQ(ownerOf(notifierName), notifier);
  moveClock("+0");
  outputOf("dunstctl action 0");
  const std::string request = analytics.readLine();
  const std::string body = analytics.read(std::stoul(request));
  EXPECT_THAT(body, HasSubstr("Notification%20Clicked"));
  EXPECT_TRUE(comesTrue([&] { return !isOnBus(name); }));
  analytics.signal(SIGTERM);
  EXPECT_THAT(analytics.readAll(), IsEmpty()) << body;
  EXPECT_EQ(displayed(), "0\n");
}

TEST_F(NotifierTest, ABannerComesWhileNoProcessOfTheProductIsInFront) {
  const Server server;
  Host host("front"), other("front", std::nullopt);
  for (Host* const inFront : {&host, &other}) {
    inFront->application.setActive(true);
    inFront->synchronise();
    for (int i = 0; i < 4; ++i) {
      const std::size_t before = host.delivered.size();
      host.deliver("hidden");
      host.await([&] { return host.delivered.size() > before; });
    }
    EXPECT_EQ(displayed(), "0\n");
    inFront->application.setActive(false);
    inFront->synchronise();
  }
  host.deliver("shown");
  host.await([] { return displayed() == "1\n"; });
  outputOf("dunstctl action 0");
  host.await([&] { return !host.clicked.empty(); });
  EXPECT_THAT(host.clicked, ElementsAre("shown"));
  EXPECT_THAT(host.delivered, SizeIs(9));
  EXPECT_EQ(host.takeLaunch(), std::nullopt);
  EXPECT_EQ(host.log.text(), "");
}

TEST_F(NotifierTest, EachProductHasItsOwnClicksAndAnOnlookerGivesWay) {
  const Server server;
  const std::string icon = VARNEL_ICON;
  Host first({.identifier = "first",
              .name = "First Product",
              .desktopEntry = "com.example.First",
              .icon = icon},
             Standing::application);
  Host onlooker("second", Standing::onlooker);
  onlooker.synchronise();
  Host second("second");
  second.deliver("second");
  second.await([] { return displayed() == "1\n"; });
  first.deliver("first");
  first.await([] { return displayed() == "2\n"; });
  outputOf("dunstctl action 0");
  first.await([] { return displayed() == "1\n"; });
  outputOf("dunstctl action 0");
  first.await([&] { return !first.clicked.empty(); });
  second.await([&] { return !second.clicked.empty(); });
  EXPECT_THAT(first.clicked, ElementsAre("first"));
  EXPECT_THAT(second.clicked, ElementsAre("second"));
  EXPECT_THAT(onlooker.clicked, IsEmpty());
  EXPECT_THAT(outputOf("dunstctl history"),
              AllOf(HasSubstr("First Product"), HasSubstr(icon), HasSubstr("x-quennel.reminder")));
  EXPECT_TRUE(comesTrue([] { return !isOnBus(notifierName); }));
}

TEST_F(NotifierTest, ABannerOutlivesItsHostAndAServerThatComesLateShowsIt) {
  auto early = std::make_unique<Server>();
  {
    Host host("late");
    host.deliver("seen");
    host.await([] { return displayed() == "1\n"; });
    host.settle();
  }
  early.reset();
  {
    Host host("late", std::nullopt);
    host.deliver("waiting", "other");
    host.settle();
  }
  const Server server;
  EXPECT_TRUE(comesTrue([] { return displayed() == "1\n"; }));
  EXPECT_THAT(outputOf("dunstctl close; dunstctl history"), HasSubstr("waiting"));
}

// Started by a shell with folders of its own, in a process that goes on without its host.
TEST_F(NotifierTest, AStoreIsFoundWhereItsApplicationKeepsItAndAClickNeedsAHost) {
  const Server server;
  ::setenv("XDG_STATE_HOME", (home_ + "/else\xffwhere").c_str(), 1);
  Host host("moved");
  host.synchronise();
  host.endListening();
  host.schedule({.identifier = "note",
                 .title = "found",
                 .deliveryDate = std::chrono::system_clock::now() + 200ms});
  host.await([] { return displayed() == "1\n"; });
  EXPECT_TRUE(isOnBus(notifierName));
  // Another process takes its time in the store.
  auto holder = Platform::SQLiteDatabase::open(home_ + "/else\xffwhere/moved/notifications.sqlite");
  EXPECT_TRUE(comesTrue([&] { return !holder->execute("BEGIN EXCLUSIVE"); }));
  outputOf("dunstctl action 0");
  host.goOn(200ms);
  EXPECT_FALSE(holder->execute("COMMIT"));
  host.await([&] { return host.takeLaunch().has_value(); });
}

// And it takes what was clicked off the list, though another process has the store at that moment.
TEST_F(NotifierTest, AHostThatHangsIsNotWaitedFor) {
  const Server server;
  Host planner("com.quennel.Orvane2", std::nullopt);
  ChildProcess listener({ORVANE_PROGRAM, "remind", "listen"});
  EXPECT_TRUE(
      comesTrue([] { return isOnBus("com.quennel.Varnel.Host.com.quennel.Orvane2.Client"); }));
  listener.signal(SIGSTOP);
  const std::string daily = "com.quennel.Orvane2.daily-cleanup-reminder";
  planner.deliver("Hello", daily);
  planner.await([] { return displayed() == "1\n"; });
  // The click waits for it, and starts nothing.
  outputOf("dunstctl action 0");
  auto holder = Platform::SQLiteDatabase::open(home_ + "/com.quennel.Orvane2/notifications.sqlite");
  EXPECT_TRUE(comesTrue([&] { return !holder->execute("BEGIN EXCLUSIVE"); }));
  listener.signal(SIGCONT);
  EXPECT_THAT(listener.readLine(), HasSubstr("delivered  " + daily + ": Hello"));
  EXPECT_THAT(listener.readLine(), HasSubstr("clicked  " + daily + ": Hello"));
  planner.goOn(200ms);
  EXPECT_FALSE(holder->execute("COMMIT"));
  planner.await([&] {
    const auto delivered = planner.center.deliveredNotifications();
    return delivered && delivered->empty();
  });
}

}  // namespace
}  // namespace Varnel::Tests
