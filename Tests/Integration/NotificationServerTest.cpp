// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <signal.h>

#include <algorithm>
#include <cstdlib>
#include <memory>

#include <Tests/Support/ChildProcess.h>
#include <Tests/Support/DrainUntil.h>
#include <Varnel/Context/ProcessFacts.h>
#include <Varnel/Identification/Analytics/CustomDimensionsHolder.h>
#include <Varnel/Modules/VarnelModule.h>
#include <Varnel/Platform/Generic/HostedApplication.h>
#include <Varnel/Platform/Generic/NotificationStore.h>
#include <Varnel/Platform/Linux/Adapters.h>
#include <Varnel/Platform/POSIX/Adapters.h>
#include <Varnel/Platform/Ports/Clock.h>
#include <Varnel/Platform/Ports/PrivateFiles.h>
#include <Varnel/Platform/Ports/UserNotificationCenter.h>
#include <Varnel/Platform/Testing/CapturedOutput.h>
#include <Varnel/Platform/Testing/FakeProcessInfo.h>
#include <Varnel/Platform/Testing/FakeTimeZones.h>
#include <Varnel/Platform/Testing/FakeUser.h>
#include <Varnel/Platform/Testing/FakeWorkspace.h>
#include <Varnel/Reminders/SchedulerService.h>
#include <Varnel/Reminders/UserNotificationRouter.h>
#include <Varnel/Tallyhouse/AnalyticsTracker.h>
#include <Varnel/Tallyhouse/Testing/MemoryTransport.h>

// What runs here has a session bus and a screen of its own: see with-desktop.
namespace Varnel {
namespace {

using namespace std::chrono_literals;
using Platform::UserNotification;
using ::testing::AllOf;
using ::testing::HasSubstr;
using ::testing::Not;
using ::testing::SizeIs;
using ::testing::StartsWith;
using Tests::outputOf;

class Server final {
 public:
  Server() { outputOf("gdbus wait --session --timeout 30 org.freedesktop.Notifications"); }

  void signal(int number) const { process_.signal(number); }
  [[nodiscard]] static std::string displayedCount() { return outputOf("dunstctl count displayed"); }

 private:
  Tests::ChildProcess process_{
      {"/usr/bin/env", "dunst", "-conf", std::string(getenv("VARNEL_DESKTOP")) + "/dunstrc"}};
};

// One run of the host.
class Host final {
 public:
  explicit Host(const std::string& product)
      : productName(product),
        center(centers->center({.identifier = product,
                                .name = "Fotovia & 3",
                                .desktopEntry = "com.example.Fotovia3",
                                .icon = "/icons/fotovia 3.png"})),
        router({center, application, *queue}) {
    module->setBundle(Bundle(VARNEL_TEST_RESOURCES, {"en"}));
    CustomDimensionsHolder::setClientIdentifier("client");
    CustomDimensionsHolder::setDownloadSourceURL(std::nullopt);
  }

  [[nodiscard]] UserNotification reminderIn(std::chrono::milliseconds delay) const {
    return {.identifier = "SchedulerNotification",
            .title = "Time to <clean> & go",
            .informativeText = "2 < 3 & \"<b>plain</b>\"\xff",
            .actionButtonTitle = "Scan",
            .otherButtonTitle = "Later",
            .deliveryDate = clock->now() + delay,
            .deliveryRepeatInterval = {{.day = 7}}};
  }

  // Until the server has said that it shows what was delivered.
  void awaitBanner() {
    EXPECT_TRUE(Tests::drainUntil(*queue, [&] { return Server::displayedCount() == "1\n"; }));
  }

  // Until the store knows that all banners have come.
  void awaitShown() {
    const std::string file =
        std::string(getenv("XDG_STATE_HOME")) + "/" + productName + "/notifications.sqlite";
    EXPECT_TRUE(Tests::drainUntil(*queue, [&] {
      using enum Platform::DeliveryState;
      const auto waiting =
          Platform::NotificationStore({*files, log}, file, Platform::Migrating::never)
              .deliveries({due, toShow});
      return waiting && waiting->empty();
    }));
  }

  const std::string productName;
  const std::unique_ptr<Platform::Clock> clock = Platform::POSIX::makeClock();
  const std::unique_ptr<Platform::MainQueue> queue = Platform::Linux::makeMainQueue();
  Platform::Testing::FakeUserLocale locale;
  Platform::Testing::FakeTimeZones zones;
  const std::unique_ptr<Platform::PrivateFiles> files = Platform::POSIX::makePrivateFiles();
  Platform::Testing::CapturedSystemLog log;
  Platform::HostedApplication application;
  Platform::Testing::FakeProcessInfo processInfo;
  Platform::Testing::FakeUserAccount account;
  Platform::Testing::FakeWorkspace workspace;
  const ProcessFacts facts{{*clock, *files, processInfo, account, workspace},
                           {.isSiteVersion = true}};
  const std::shared_ptr<VarnelModule> module = std::make_shared<VarnelModule>();
  const std::shared_ptr<Tallyhouse::Testing::MemoryTransport> sent =
      std::make_shared<Tallyhouse::Testing::MemoryTransport>();
  const std::unique_ptr<Platform::UserNotificationCenters> centers =
      Platform::Linux::makeUserNotificationCenters({*clock, locale, zones, *queue, *files, log},
                                                   application);
  Platform::UserNotificationCenter& center;
  UserNotificationRouter router;
  SchedulerService service{
      {*clock, locale, zones, *queue, facts, module},
      std::make_shared<Tallyhouse::AnalyticsTracker>(sent, Tallyhouse::Consent::granted),
      router};
};

TEST(NotificationServer, AReminderAppearsAndItsEndComesBackOnce) {
  Server server;
  Host host("clicks");
  const std::pair<const char*, std::size_t> ends[] = {
      {"dunstctl action 0", 1}, {"dunstctl context", 1}, {"dunstctl close", 0}};
  for (const auto& [end, clicks] : ends) {
    const std::size_t before = host.sent->events().size();
    EXPECT_FALSE(host.center.scheduleNotification(host.reminderIn(300ms)));
    host.awaitBanner();
    EXPECT_THAT(*host.center.deliveredNotifications(), SizeIs(1));
    outputOf(end);
    EXPECT_TRUE(Tests::drainUntil(*host.queue,
                                  [&] { return host.center.deliveredNotifications()->empty(); }));
    EXPECT_TRUE(Tests::drainUntil(*host.queue, [&] { return Server::displayedCount() == "0\n"; }));
    host.queue->drain();
    EXPECT_EQ(host.sent->events().size(), before + clicks) << end;
    EXPECT_EQ(host.sent->events().back().action, "Notification Clicked");
    EXPECT_THAT(*host.center.scheduledNotifications(), SizeIs(1));
  }
  const std::string history = outputOf("dunstctl history");
  EXPECT_THAT(history, HasSubstr("Fotovia & 3"));
  EXPECT_THAT(history, HasSubstr("Time to <clean> & go"));
  EXPECT_THAT(history, HasSubstr("2 &lt; 3 &amp; &quot;&lt;b&gt;plain&lt;/b&gt;&quot;"));
  EXPECT_EQ(host.log.text(), "");
}

TEST(NotificationServer, ADeliveryWhileTheLastIsOnItsWayKeepsTheBanner) {
  Server server;
  Host host("rapid");
  EXPECT_FALSE(host.center.deliverNotification(host.reminderIn(0s)));
  host.awaitShown();
  // Each time a step later on the way of the messages.
  for (int steps = 0; steps < 10; ++steps) {
    EXPECT_FALSE(host.center.deliverNotification(host.reminderIn(0s)));
    for (int step = 0; step < steps; ++step)
      if (Tests::isReadable(*host.queue->descriptor(), 20ms)) host.queue->drain();
    EXPECT_FALSE(host.center.deliverNotification(host.reminderIn(0s)));
    host.awaitShown();
    ASSERT_EQ(Server::displayedCount(), "1\n") << steps;
    ASSERT_FALSE(testing::Test::HasFailure()) << steps;
  }
}

TEST(NotificationServer, ABannerThatFindsNoServerIsShownWhenOneComes) {
  auto server = std::make_unique<Server>();
  Host host("restart");
  EXPECT_FALSE(host.center.deliverNotification({.identifier = "seen", .title = "Seen"}));
  host.awaitShown();
  server.reset();
  EXPECT_FALSE(host.center.scheduleNotification(host.reminderIn(0s)));
  EXPECT_TRUE(Tests::drainUntil(*host.queue, [&] { return !host.log.text().empty(); }));
  EXPECT_THAT(host.log.text(), HasSubstr("Cannot show a notification"));
  EXPECT_THAT(*host.center.deliveredNotifications(), SizeIs(2));
  server = std::make_unique<Server>();
  host.awaitShown();
  // What had been shown is not shown again.
  EXPECT_EQ(Server::displayedCount(), "1\n");
  const std::string said = host.log.text();
  EXPECT_EQ(std::count(said.begin(), said.end(), '\n'), 1) << said;
}

TEST(NotificationServer, ABannerThatAHangingServerTookComesOnceAndIsNotLostWithIt) {
  for (const bool isEnded : {false, true}) {
    auto server = std::make_unique<Server>();
    Host host(isEnded ? "hanging" : "ended");
    EXPECT_FALSE(host.center.deliverNotification({.identifier = "first", .title = "First"}));
    host.awaitShown();
    server->signal(SIGSTOP);
    EXPECT_FALSE(host.center.deliverNotification(host.reminderIn(0s)));
    host.queue->drain();
    EXPECT_TRUE(host.center.isBusy());
    if (isEnded) {
      server.reset();
      server = std::make_unique<Server>();
    } else {
      server->signal(SIGCONT);
    }
    host.awaitShown();
    EXPECT_EQ(Server::displayedCount(), isEnded ? "1\n" : "2\n");
  }
}

TEST(NotificationServer, ABusThatAnswersLateDelaysTheBannerAlone) {
  Server server;
  const std::string answer = outputOf(
      "gdbus call --session -d org.freedesktop.DBus -o /org/freedesktop/DBus "
      "-m org.freedesktop.DBus.GetConnectionUnixProcessID org.freedesktop.DBus");
  const pid_t bus = std::stoi(answer.substr(answer.find(' ')));
  ASSERT_EQ(::kill(bus, SIGSTOP), 0);
  Host host("late");
  EXPECT_FALSE(host.center.scheduleNotification(host.reminderIn(0s)));
  host.queue->drain();
  EXPECT_TRUE(host.center.isBusy());
  ASSERT_EQ(::kill(bus, SIGCONT), 0);
  host.awaitBanner();
  EXPECT_EQ(host.log.text(), "");
}

TEST(NotificationServer, ANextRunDeliversWhatTheLastOneCouldNotAndTakesItsBannersAway) {
  Server server;
  {
    Host host("runs");
    EXPECT_FALSE(host.center.deliverNotification({.identifier = "left", .title = "Left behind"}));
    host.awaitShown();
    // Due only when the process has gone.
    host.center.setDelegate({});
    EXPECT_FALSE(host.center.scheduleNotification(host.reminderIn(0s)));
  }
  Host next("runs");
  while (Server::displayedCount() != "2\n") next.queue->drain();
  next.awaitShown();
  const auto settle = [&] { next.queue->runWhile([&] { return next.center.isBusy(); }); };
  EXPECT_FALSE(next.router.removeDeliveredNotifications("left"));
  settle();
  EXPECT_EQ(Server::displayedCount(), "1\n");
  next.service.setSchedulePeriod(SchedulePeriodOption::never);
  settle();
  EXPECT_EQ(Server::displayedCount(), "0\n");
}

TEST(NotificationServer, OneProcessLearnsAtOnceWhatAnotherSchedules) {
  Server server;
  Host host("watch");
  Host other("watch");
  other.center.setDelegate({});
  EXPECT_FALSE(other.center.scheduleNotification(other.reminderIn(100ms)));
  host.awaitBanner();
  EXPECT_THAT(*other.center.deliveredNotifications(), SizeIs(1));
}

TEST(NotificationServer, AProgramThatPlansWaitsForAFrozenServerOnlyAWhile) {
  Server server;
  ::setenv("HOME", getenv("VARNEL_DESKTOP"), 1);
  Host host("com.quennel.Orvane2");
  EXPECT_FALSE(host.center.deliverNotification(host.reminderIn(0s)));
  host.awaitShown();
  server.signal(SIGSTOP);
  const auto start = std::chrono::steady_clock::now();
  EXPECT_THAT(outputOf(std::string(ORVANE_PROGRAM) + " remind every weekly 2>&1"),
              AllOf(HasSubstr("the desktop does not answer"), HasSubstr("\nscheduled ")));
  EXPECT_LT(std::chrono::steady_clock::now() - start, 15s);
  server.signal(SIGCONT);
  while (Server::displayedCount() != "0\n") continue;
}

TEST(NotificationServer, AProgramThatListensTellsOfDeliveriesAndClicks) {
  Server server;
  ::setenv("HOME", getenv("VARNEL_DESKTOP"), 1);
  outputOf(std::string(ORVANE_PROGRAM) + " remind every weekly");
  Host host("com.quennel.Orvane2");
  host.center.setDelegate({});
  EXPECT_FALSE(host.center.scheduleNotification(host.reminderIn(0s)));
  Tests::ChildProcess listener({ORVANE_PROGRAM, "remind", "listen"});
  EXPECT_THAT(listener.readLine(),
              StartsWith("delivered  SchedulerNotification: Time to <clean> & go"));
  while (Server::displayedCount() != "1\n") continue;
  outputOf("dunstctl action 0");
  EXPECT_THAT(listener.readLine(), StartsWith("clicked  SchedulerNotification"));
  EXPECT_THAT(outputOf(std::string(ORVANE_PROGRAM) + " remind status"),
              AllOf(HasSubstr("\nscheduled "), Not(HasSubstr("\ndelivered "))));
}

}  // namespace
}  // namespace Varnel
