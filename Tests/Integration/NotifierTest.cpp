// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <signal.h>
#include <unistd.h>

#include <chrono>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <memory>
#include <optional>
#include <thread>

#include <Tests/Support/ChildProcess.h>
#include <Varnel/Platform/Generic/HostedApplication.h>
#include <Varnel/Platform/Linux/Adapters.h>
#include <Varnel/Platform/POSIX/Adapters.h>
#include <Varnel/Platform/Ports/Clock.h>
#include <Varnel/Platform/Ports/MainQueue.h>
#include <Varnel/Platform/Ports/PrivateFiles.h>
#include <Varnel/Platform/Ports/TimeZones.h>
#include <Varnel/Platform/Ports/UserNotificationCenter.h>
#include <Varnel/Platform/SQLite/SQLiteDatabase.h>
#include <Varnel/Platform/Testing/CapturedOutput.h>
#include <Varnel/Platform/Testing/FakeUser.h>
#include <Varnel/Reminders/UserNotificationRouter.h>

// What runs here has a session bus and a screen of its own: see with-desktop.
namespace Varnel {
namespace {

namespace fs = std::filesystem;
using namespace std::chrono_literals;
using Platform::UserNotification;
using Standing = UserNotificationRouter::Standing;
using EventKind = UserNotificationRouter::EventKind;
using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;
using ::testing::SizeIs;
using Tests::outputOf;

const std::string desktop = getenv("VARNEL_DESKTOP") ? getenv("VARNEL_DESKTOP") : "";
constexpr const char* notifierName = "com.quennel.Varnel.Notifier1";

std::string callBus(const std::string& method, const std::string& arguments) {
  return outputOf(
      "gdbus call --session -d org.freedesktop.DBus -o /org/freedesktop/DBus "
      "-m org.freedesktop.DBus." +
      method + " " + arguments + " 2>/dev/null");
}

bool isOnBus(const std::string& name) {
  return callBus("NameHasOwner", name) == "(true,)\n";
}

// The process that owns a name, or 0.
pid_t ownerOf(const std::string& name) {
  const std::string answer = callBus("GetConnectionUnixProcessID", name);
  return answer.empty() ? 0 : std::stoi(answer.substr(answer.find(' ')));
}

// Asks again and again, as services are started and end by themselves.
template <typename Condition>
bool comesTrue(Condition condition) {
  const auto end = std::chrono::steady_clock::now() + 20s;
  while (!condition())
    if (std::chrono::steady_clock::now() > end) return false;
  return true;
}

std::string displayed() {
  return outputOf("dunstctl count displayed");
}

class Server final {
 public:
  Server() { outputOf("gdbus wait --session --timeout 30 org.freedesktop.Notifications"); }

 private:
  Tests::ChildProcess process_{{"/usr/bin/env", "dunst", "-conf", desktop + "/dunstrc"}};
};

// A session in which the bus starts the notifier, whose clock is its own.
class NotifierTest : public testing::Test {
 protected:
  NotifierTest() {
    fs::remove_all(home_);
    fs::create_directories(home_ + "/share/applications");
    for (const char* variable : {"HOME", "XDG_STATE_HOME", "XDG_CONFIG_HOME"})
      ::setenv(variable, home_.c_str(), 1);
    ::setenv("XDG_DATA_HOME", (home_ + "/share").c_str(), 1);
    moveClock("+0");
    install(VARNEL_NOTIFIER);
  }
  ~NotifierTest() override {
    if (const pid_t notifier = ownerOf(notifierName)) ::kill(notifier, SIGKILL);
    EXPECT_TRUE(comesTrue([] { return !isOnBus(notifierName); }));
    for (const auto& service : fs::directory_iterator(desktop + "/services"))
      fs::remove(service.path());
  }

  void write(const std::string& name, const std::string& text) const {
    std::ofstream(home_ + "/" + name) << text;
  }
  void addService(const std::string& name, const std::string& line) const {
    std::ofstream(desktop + "/services/" + name + ".service")
        << "[D-BUS Service]\nName=" << name << "\nExec=" << line << "\n";
    callBus("ReloadConfig", "");
  }
  void install(const std::string& program) const {
    write("notifier", "#!/bin/sh\nexec env HOME=" + home_ + " XDG_STATE_HOME=" + home_ +
                          " XDG_DATA_HOME=" + home_ +
                          "/share LD_PRELOAD=" VARNEL_FAKETIME
                          " FAKETIME_NO_CACHE=1"
                          " FAKETIME_TIMESTAMP_FILE=" +
                          home_ + "/clock " + program + "\n");
    fs::permissions(home_ + "/notifier", fs::perms::owner_all);
    addService(notifierName, home_ + "/notifier");
  }
  // By a number of seconds, with its sign.
  void moveClock(const std::string& seconds) const { write("clock", seconds + "\n"); }

  const std::string home_ = desktop + "/home";
};

// One process of a product, as far as the bus knows; it remembers its events.
class Host final {
 public:
  explicit Host(const std::string& product,
                std::optional<Standing> standing = Standing::application)
      : center(centers_->center({.identifier = product, .name = product})) {
    if (!standing) return;
    router_.emplace(UserNotificationRouter::Ports{center, application, *queue_}, *standing);
    router_->register_("note", [this](const auto& notification, EventKind kind) {
      (kind == EventKind::didDeliver ? delivered : clicked).push_back(*notification.title);
    });
  }

  void deliver(const std::string& title) {
    EXPECT_FALSE(center.deliverNotification({.identifier = "note", .title = title}));
  }
  template <typename Condition>
  void await(Condition condition) {
    EXPECT_TRUE(comesTrue([&] {
      queue_->drain();
      return condition();
    }));
  }
  void endListening() { router_.reset(); }
  // What it has sent has arrived at the bus.
  void synchronise() {
    bool isAnswered = false;
    queue_->drain();
    center.checkBanners([&](const auto&) { isAnswered = true; });
    await([&] { return isAnswered; });
  }
  // Waits while the store is busy.
  std::optional<UserNotification> takeLaunch() {
    std::optional<UserNotification> launch;
    await([&] {
      const auto taken = center.takeLaunchNotification();
      if (taken) launch = *taken;
      return taken.hasValue();
    });
    return launch;
  }
  void settle() {
    queue_->runWhile([this] { return center.isBusy(); }, 10s);
  }

 private:
  const std::unique_ptr<Platform::Clock> clock_ = Platform::POSIX::makeClock();
  const std::unique_ptr<Platform::MainQueue> queue_ = Platform::Linux::makeMainQueue();
  const std::unique_ptr<Platform::TimeZones> zones_ = Platform::Linux::makeTimeZones();
  const std::unique_ptr<Platform::PrivateFiles> files_ = Platform::POSIX::makePrivateFiles();
  Platform::Testing::FakeUserLocale locale_;

 public:
  Platform::Testing::CapturedSystemLog log;
  Platform::HostedApplication application;

 private:
  const std::unique_ptr<Platform::UserNotificationCenters> centers_ =
      Platform::Linux::makeUserNotificationCenters(
          {*clock_, locale_, *zones_, *queue_, *files_, log}, application);

 public:
  Platform::UserNotificationCenter& center;
  std::vector<std::string> delivered, clicked;

 private:
  std::optional<UserNotificationRouter> router_;
};

TEST_F(NotifierTest, AReminderComesToAnApplicationThatDoesNotRunAndAClickStartsIt) {
  const std::string name = "com.example.StartOnAClick", example = VARNEL_EXAMPLE;
  Tests::ChildProcess analytics({VARNEL_ANALYTICS_SERVER, VARNEL_CERTIFICATE, "200"});
  addService(name, "/usr/bin/env HOME=" + home_ + " XDG_STATE_HOME=" + home_ + " " + example +
                       " serve http://127.0.0.1:" + analytics.readLine() + "/batch");
  write("share/applications/" + name + ".desktop",
        "[Desktop Entry]\nType=Application\nName=Example\nExec=" + example +
            " serve\nDBusActivatable=true\n");
  const Server server;
  constexpr int almostAWeek = 7 * 24 * 60 * 60 - 2;
  moveClock("+" + std::to_string(almostAWeek));
  EXPECT_EQ(Tests::ChildProcess({example, "plan"}).wait(), 0);
  const pid_t notifier = ownerOf(notifierName);
  EXPECT_NE(notifier, 0);
  EXPECT_TRUE(comesTrue([] { return displayed() == "1\n"; }));
  const std::string history = outputOf("dunstctl history-pop; dunstctl history");
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
  Host first("first"), second("second"), onlooker("second", Standing::onlooker);
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
    EXPECT_FALSE(host.center.deliverNotification({.identifier = "other", .title = "waiting"}));
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
  EXPECT_FALSE(
      host.center.scheduleNotification({.identifier = "note",
                                        .title = "found",
                                        .deliveryDate = std::chrono::system_clock::now() + 200ms}));
  host.await([] { return displayed() == "1\n"; });
  EXPECT_TRUE(isOnBus(notifierName));
  // Another process takes its time in the store.
  auto holder = Platform::SQLiteDatabase::open(home_ + "/else\xffwhere/moved/notifications.sqlite");
  EXPECT_TRUE(comesTrue([&] { return !holder->execute("BEGIN EXCLUSIVE"); }));
  outputOf("dunstctl action 0");
  const auto end = std::chrono::steady_clock::now() + 200ms;
  host.await([&] { return std::chrono::steady_clock::now() > end; });
  EXPECT_FALSE(holder->execute("COMMIT"));
  host.await([&] { return host.takeLaunch().has_value(); });
}

TEST_F(NotifierTest, AHostThatHangsIsNotWaitedFor) {
  const Server server;
  Host planner("com.quennel.Orvane2", std::nullopt);
  Tests::ChildProcess listener({ORVANE_PROGRAM, "remind", "listen"});
  EXPECT_TRUE(
      comesTrue([] { return isOnBus("com.quennel.Varnel.Host.com.quennel.Orvane2.Client"); }));
  listener.signal(SIGSTOP);
  EXPECT_FALSE(planner.center.deliverNotification(
      {.identifier = "SchedulerNotification", .title = "Hello"}));
  planner.await([] { return displayed() == "1\n"; });
  // The click waits for it, and starts nothing.
  outputOf("dunstctl action 0");
  listener.signal(SIGCONT);
  EXPECT_THAT(listener.readLine(), HasSubstr("delivered  SchedulerNotification: Hello"));
  EXPECT_THAT(listener.readLine(), HasSubstr("clicked  SchedulerNotification: Hello"));
}

TEST_F(NotifierTest, ANotifierWithNothingToDoEnds) {
  // Somebody else's, who encrypts it.
  fs::create_directory(home_ + "/foreign");
  write("foreign/notifications.sqlite", std::string(8192, 'x'));
  EXPECT_EQ(Tests::ChildProcess({VARNEL_NOTIFIER}).wait(), 0);
  const std::string orvane = ORVANE_PROGRAM;
  outputOf(orvane + " remind every weekly");
  EXPECT_TRUE(isOnBus(notifierName));
  EXPECT_EQ(outputOf("ls " + home_ + "/foreign"), "notifications.sqlite\n");
  // There is one of them.
  EXPECT_EQ(Tests::ChildProcess({VARNEL_NOTIFIER}).wait(), 0);
  outputOf(orvane + " remind every never");
  EXPECT_TRUE(comesTrue([] { return !isOnBus(notifierName); }));
}

// Asleep it has little memory of its own, and nothing wakes it.
TEST_F(NotifierTest, ANotifierSleeps) {
  outputOf(std::string(ORVANE_PROGRAM) + " remind every weekly");
  const std::string process = "/proc/" + std::to_string(ownerOf(notifierName));
  const auto figure = [&](const char* file, const char* name) {
    std::ifstream lines(process + file);
    for (std::string line; std::getline(lines, line);)
      if (line.starts_with(name)) return std::stol(line.substr(std::string(name).size()));
    return -1l;
  };
  EXPECT_LT(figure("/smaps_rollup", "Private_Dirty:"), 1800);
  std::this_thread::sleep_for(1s);
  const long switches = figure("/status", "voluntary_ctxt_switches:");
  std::this_thread::sleep_for(3s);
  EXPECT_EQ(figure("/status", "voluntary_ctxt_switches:"), switches);
}

TEST_F(NotifierTest, WithoutItsProgramItEndsAndTheHostDeliversItself) {
  const std::string copy = home_ + "/varnel-notifier";
  fs::copy_file(VARNEL_NOTIFIER, copy);
  install(copy);
  const Server server;
  Host host("removed");
  EXPECT_FALSE(host.center.scheduleNotification(
      {.identifier = "later", .deliveryDate = std::chrono::system_clock::now() + 24h}));
  host.settle();
  // Its host calls it back when it was killed, but not when it has gone.
  const pid_t killed = ownerOf(notifierName);
  ASSERT_NE(killed, 0);
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

}  // namespace
}  // namespace Varnel
