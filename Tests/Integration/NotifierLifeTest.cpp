// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <fstream>
#include <string>
#include <thread>

#include <Tests/Integration/NotifierSession.h>
#include <Tests/Reminders/CenterProcess.h>

namespace Varnel::Tests {
namespace {

using ::testing::Contains;
using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::Not;

// A process that plans and is gone before it tells the notifier.
class Product final {
 public:
  explicit Product(const std::string& folder)
      : process_(folder + "/notifications.sqlite", std::chrono::system_clock::now()) {}

  void plan(const std::string& title, std::chrono::hours later = 0h,
            std::optional<Platform::DateComponents> interval = std::nullopt) {
    const UserNotification planned{.identifier = title,
                                   .title = title,
                                   .deliveryDate = std::chrono::system_clock::now() + later,
                                   .deliveryRepeatInterval = interval};
    // The notifier may have the store locked.
    EXPECT_TRUE(comesTrue([&] { return !process_.center.scheduleNotification(planned); }));
  }
  void planForLater() { plan("later", 24h); }
  [[nodiscard]] std::size_t countPlanned() { return process_.scheduled().size(); }
  [[nodiscard]] std::size_t countDelivered() { return process_.delivered().size(); }

 private:
  Platform::Testing::Process process_;
};

// When the notifier runs, for how long, and what its end costs.
TEST_F(NotifierTest, ANotifierWithNothingToDoEnds) {
  // Somebody else's, who encrypts it.
  fs::create_directory(home_ + "/foreign");
  write("foreign/notifications.sqlite", std::string(8192, 'x'));
  EXPECT_EQ(ChildProcess({VARNEL_NOTIFIER}).wait(), 0);
  const std::string orvane = ORVANE_PROGRAM;
  outputOf(orvane + " remind every weekly");
  startedNotifier();
  EXPECT_EQ(outputOf("ls " + home_ + "/foreign"), "notifications.sqlite\n");
  // There is one of them.
  EXPECT_EQ(ChildProcess({VARNEL_NOTIFIER}).wait(), 0);
  outputOf(orvane + " remind every never");
  EXPECT_TRUE(comesTrue([] { return !isOnBus(notifierName); }));
}

// Asleep it has little memory of its own, and nothing wakes it.
TEST_F(NotifierTest, ANotifierSleeps) {
  outputOf(std::string(ORVANE_PROGRAM) + " remind every weekly");
  const std::string process = "/proc/" + std::to_string(startedNotifier());
  const auto figure = [&](const char* file, const char* name) {
    std::ifstream lines(process + file);
    for (std::string line; std::getline(lines, line);)
      if (line.starts_with(name)) return std::stol(line.substr(std::string(name).size()));
    return -1l;
  };
  // The private dirty memory, but for a program's pages that were built a moment ago.
  EXPECT_LT(figure("/smaps_rollup", "Anonymous:"), 1200);
  // Once it has fallen asleep.
  EXPECT_TRUE(comesTrue([&] {
    const long switches = figure("/status", "voluntary_ctxt_switches:");
    std::this_thread::sleep_for(3s);
    return figure("/status", "voluntary_ctxt_switches:") == switches;
  }));
}

TEST_F(NotifierTest, WithoutItsProgramItEndsAndTheHostDeliversItself) {
  const std::string copy = home_ + "/varnel-notifier";
  fs::copy_file(VARNEL_NOTIFIER, copy);
  install(copy);
  const Server server;
  Host host("removed");
  host.schedule({.identifier = "later", .deliveryDate = std::chrono::system_clock::now() + 24h});
  host.settle();
  // Its host calls it back when it was killed, but not when it has gone.
  const pid_t killed = startedNotifier();
  ::kill(killed, SIGKILL);
  host.await([&] { return ownerOf(notifierName) != killed && isOnBus(notifierName); });
  host.settle();
  fs::remove(copy);
  EXPECT_TRUE(comesTrue([] { return !isOnBus(notifierName); }));
  // As where the package has gone, and its files with it.
  fs::remove(home_ + "/notifier");
  host.deliver("by itself");
  host.await([] { return displayed() == "1\n"; });
  outputOf("dunstctl action 0");
  host.await([&] { return !host.clicked.empty(); });
}

// Its host goes on meanwhile, and what it has planned comes once.
TEST_F(NotifierTest, OneThatHangsIsNotWaitedForAndDeliversWhenItGoesOnOrHasEnded) {
  const Server server;
  Host host("patient");
  host.schedule({.identifier = "later", .deliveryDate = std::chrono::system_clock::now() + 24h});
  host.settle();
  for (const int end : {SIGCONT, SIGKILL}) {
    const pid_t notifier = startedNotifier();
    const std::string title = end == SIGCONT ? "goes on" : "has ended";
    // Not while it has the store locked.
    EXPECT_TRUE(comesTrue([&] {
      ::kill(notifier, SIGSTOP);
      const bool isPlanned = !host.center.scheduleNotification(
          {.identifier = "note", .title = title, .deliveryDate = std::chrono::system_clock::now()});
      if (!isPlanned) ::kill(notifier, SIGCONT);
      return isPlanned;
    }));
    host.synchronise();
    EXPECT_TRUE(host.center.isBusy());
    EXPECT_THAT(host.delivered, Not(Contains(title)));
    ::kill(notifier, end);
    host.await([&] {
      return outputOf("dunstctl close; dunstctl history").find(title) != std::string::npos &&
             host.delivered.size() == (end == SIGCONT ? 1 : 2);
    });
    EXPECT_EQ(startedNotifier() == notifier, end == SIGCONT);
  }
  EXPECT_THAT(host.delivered, ElementsAre("goes on", "has ended"));
}

// As a session starts: the notifier first, and the desktop later.
TEST_F(NotifierTest, AtLoginItWaitsForAServerAndForTheOneAfterIt) {
  Product product(home_ + "/login");
  product.plan("early");
  ChildProcess notifier({VARNEL_NOTIFIER});
  EXPECT_TRUE(comesTrue([] { return isOnBus(notifierName); }));
  auto server = std::make_unique<Server>();
  EXPECT_TRUE(comesTrue([] { return displayed() == "1\n"; }));
  product.planForLater();
  server = nullptr;
  server = std::make_unique<Server>();
  product.plan("late");
  EXPECT_TRUE(comesTrue([] { return displayed() == "1\n"; }));
  EXPECT_THAT(outputOf("dunstctl close; dunstctl history"), Not(HasSubstr("early")));
}

// Its planner is killed before it tells anybody, and perhaps its folder is a new one.
TEST_F(NotifierTest, WhatNobodyTellsOfIsFound) {
  const Server server;
  const std::string folder = home_ + "/silent";
  Product(home_ + "/known").planForLater();
  ChildProcess notifier({VARNEL_NOTIFIER});
  EXPECT_TRUE(comesTrue([] { return isOnBus(notifierName); }));
  for (const char* const pass : {"new ", "made again "}) {
    Product product(folder);
    for (const std::string title : {"first", "next"}) {
      product.plan(pass + title);
      EXPECT_TRUE(comesTrue([&] {
        return outputOf("dunstctl close-all; dunstctl history").find(pass + title) !=
               std::string::npos;
      })) << pass
          << title;
    }
    // Files of other programs, which write each anew, are looked at once.
    for (int i = 0; i < 50; ++i) write(std::to_string(i), "");
    for (int i = 0; i < 50; ++i) {
      const fs::path ofAMoment = home_ + "/moment" + std::to_string(i);
      fs::create_directory(ofAMoment);
      fs::remove(ofAMoment);
    }
    fs::remove_all(folder);
  }
  ASSERT_NE(ownerOf(notifierName), 0);
  const std::string descriptors = "/proc/" + std::to_string(ownerOf(notifierName)) + "/fd";
  EXPECT_LT(std::stoi(outputOf("ls -l " + descriptors + " | grep -c inotify")), 10);
}

TEST_F(NotifierTest, AProgramThatIsReplacedTakesOverOnceNoBannerIsUp) {
  const std::string copy = home_ + "/varnel-notifier";
  fs::copy_file(VARNEL_NOTIFIER, copy);
  install(copy);
  const Server server;
  Product product(home_ + "/upgraded");
  product.planForLater();
  Host host("upgraded", std::nullopt);
  host.deliver("up");
  host.await([] { return displayed() == "1\n"; });
  const pid_t old = ownerOf(notifierName);
  const auto isAwake = [&] {
    return outputOf(
               "gdbus call --session -d com.quennel.Varnel.Notifier1 -o "
               "/com/quennel/Varnel/Notifier -m com.quennel.Varnel.Notifier1.Changed '[]'") ==
           "(false,)\n";
  };
  // Away for a moment, and back.
  fs::rename(copy, copy + ".old");
  EXPECT_TRUE(isAwake());
  fs::rename(copy + ".old", copy);
  fs::copy_file(VARNEL_NOTIFIER, copy + ".new");
  fs::rename(copy + ".new", copy);
  EXPECT_TRUE(isAwake());
  EXPECT_EQ(ownerOf(notifierName), old);
  // One that does not start, as while it is being written, leaves the place to the old one.
  write("tried", "#!/bin/sh\n: >" + home_ + "/failed\nexit 1\n");
  fs::permissions(home_ + "/tried", fs::perms::owner_all);
  fs::rename(home_ + "/tried", copy);
  outputOf("dunstctl close");
  EXPECT_TRUE(comesTrue([&] { return fs::exists(home_ + "/failed"); }));
  EXPECT_TRUE(comesTrue([&] { return ownerOf(notifierName) == old; }));
  fs::copy_file(VARNEL_NOTIFIER, copy + ".new");
  fs::rename(copy + ".new", copy);
  EXPECT_TRUE(comesTrue([&] {
    const pid_t present = ownerOf(notifierName);
    return present != 0 && present != old;
  }));
}

// As an upgrade does that brings another version's folder and takes the old one's away. No module
// lies beside them: without the one that counts days, what is delivered stays planned.
TEST_F(NotifierTest, AProgramElsewhereTakesOverFromOneThatHasGone) {
  const std::string copy = home_ + "/varnel-notifier", next = copy + "-of-the-next-version";
  fs::copy_file(VARNEL_NOTIFIER, copy);
  install(copy);
  Product product(home_ + "/upgraded");
  product.planForLater();
  product.plan("daily", 0h, Platform::DateComponents{.day = 1});
  callBus("StartServiceByName", std::string(notifierName) + " 0");
  EXPECT_TRUE(comesTrue([&] { return product.countDelivered() == 1; }));
  EXPECT_TRUE(comesTrue([&] { return product.countPlanned() == 2; }));
  const pid_t old = ownerOf(notifierName);
  ASSERT_NE(old, 0);
  fs::copy_file(copy, next);
  install(next);
  fs::remove(copy);
  EXPECT_TRUE(comesTrue([&] {
    const pid_t present = ownerOf(notifierName);
    return present != 0 && present != old;
  }));
}

TEST_F(NotifierTest, OneThatIsKilledAtItsStartIsStartedAgain) {
  write("start", "#!/bin/sh\n[ -e " + home_ + "/killed ] && exec " + home_ + "/notifier\n: >" +
                     home_ + "/killed\nkill -KILL $$\n");
  fs::permissions(home_ + "/start", fs::perms::owner_all);
  addService(notifierName, home_ + "/start");
  Host host("persistent");
  host.schedule({.identifier = "later", .deliveryDate = std::chrono::system_clock::now() + 24h});
  host.await([] { return isOnBus(notifierName); });
}

}  // namespace
}  // namespace Varnel::Tests
