// SPDX-License-Identifier: MIT
#pragma once

#include <gtest/gtest.h>
#include <signal.h>
#include <unistd.h>

#include <chrono>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <memory>
#include <optional>
#include <stdexcept>
#include <string>
#include <vector>

#include <Tests/Support/ChildProcess.h>
#include <Varnel/Platform/Generic/HostedApplication.h>
#include <Varnel/Platform/Linux/Adapters.h>
#include <Varnel/Platform/POSIX/Adapters.h>
#include <Varnel/Platform/Ports/Clock.h>
#include <Varnel/Platform/Ports/MainQueue.h>
#include <Varnel/Platform/Ports/PrivateFiles.h>
#include <Varnel/Platform/Ports/TimeZones.h>
#include <Varnel/Platform/Ports/UserNotificationCenter.h>
#include <Varnel/Platform/Testing/CapturedOutput.h>
#include <Varnel/Platform/Testing/FakeUser.h>
#include <Varnel/Reminders/UserNotificationRouter.h>

/// What runs here has a session bus and a screen of its own: see with-desktop.
namespace Varnel::Tests {

namespace fs = std::filesystem;
using namespace std::chrono_literals;
using Platform::UserNotification;
using Standing = UserNotificationRouter::Standing;
using EventKind = UserNotificationRouter::EventKind;

inline const std::string desktop =
    std::getenv("VARNEL_DESKTOP") ? std::getenv("VARNEL_DESKTOP") : "";
inline constexpr const char* notifierName = "com.quennel.Varnel.Notifier1";

inline std::string callBus(const std::string& method, const std::string& arguments) {
  return outputOf(
      "gdbus call --session -d org.freedesktop.DBus -o /org/freedesktop/DBus "
      "-m org.freedesktop.DBus." +
      method + " " + arguments + " 2>/dev/null");
}

inline bool isOnBus(const std::string& name) {
  return callBus("NameHasOwner", name) == "(true,)\n";
}

/// The process that owns a name, or 0.
inline pid_t ownerOf(const std::string& name) {
  const std::string answer = callBus("GetConnectionUnixProcessID", name);
  return answer.empty() ? 0 : std::stoi(answer.substr(answer.find(' ')));
}

/// A busy machine starts a service in seconds.
inline constexpr std::chrono::seconds maxWait = 60s;

/// Asks again and again, as services are started and end by themselves.
template <typename Condition>
bool comesTrue(Condition condition) {
  const auto end = std::chrono::steady_clock::now() + maxWait;
  while (!condition())
    if (std::chrono::steady_clock::now() > end) return false;
  return true;
}

/// The notifier's process, once the bus has started it.
inline pid_t startedNotifier() {
  pid_t notifier = 0;
  if (!comesTrue([&] { return (notifier = ownerOf(notifierName)) != 0; }))
    throw std::runtime_error("The notifier is not started.");
  return notifier;
}

inline std::string displayed() {
  return outputOf("dunstctl count displayed");
}

class Server final {
 public:
  Server() { outputOf("gdbus wait --session --timeout 30 org.freedesktop.Notifications"); }

 private:
  ChildProcess process_{{"/usr/bin/env", "dunst", "-conf", desktop + "/dunstrc"}};
};

/// A session in which the bus starts the notifier, whose clock is its own.
class NotifierTest : public testing::Test {
 protected:
  NotifierTest() {
    fs::create_directories(home_ + "/share/applications");
    for (const char* variable : {"HOME", "XDG_STATE_HOME", "XDG_CONFIG_HOME"})
      ::setenv(variable, home_.c_str(), 1);
    ::setenv("XDG_DATA_HOME", (home_ + "/share").c_str(), 1);
    moveClock("+0");
    install(VARNEL_NOTIFIER);
  }
  // One that the bus is just starting ends as well.
  ~NotifierTest() override {
    for (const auto& service : fs::directory_iterator(desktop + "/services"))
      fs::remove(service.path());
    callBus("ReloadConfig", "");
    EXPECT_TRUE(comesTrue([] {
      const pid_t notifier = ownerOf(notifierName);
      if (notifier != 0) ::kill(notifier, SIGKILL);
      return notifier == 0;
    }));
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

  /// Its own, because what an earlier test has started may still write.
  const std::string home_ =
      desktop + "/" + testing::UnitTest::GetInstance()->current_test_info()->name();
};

/// One process of a product, as far as the bus knows; it remembers its events.
class Host final {
 public:
  explicit Host(const std::string& product,
                std::optional<Standing> standing = Standing::application)
      : Host({.identifier = product, .name = product}, standing) {}
  Host(const Platform::NotificationSource& source, std::optional<Standing> standing)
      : center(centers_->center(source)) {
    if (!standing) return;
    router_.emplace(UserNotificationRouter::Ports{center, application, *queue_}, *standing);
    router_->register_("note", [this](const auto& notification, EventKind kind) {
      (kind == EventKind::didDeliver ? delivered : clicked).push_back(*notification.title);
    });
  }

  // The notifier may have the store locked.
  void deliver(const std::string& title, const std::string& identifier = "note") {
    EXPECT_TRUE(comesTrue(
        [&] { return !center.deliverNotification({.identifier = identifier, .title = title}); }));
  }
  void schedule(const UserNotification& notification) {
    EXPECT_TRUE(comesTrue([&] { return !center.scheduleNotification(notification); }));
  }
  template <typename Condition>
  void await(Condition condition) {
    EXPECT_TRUE(comesTrue([&] {
      queue_->drain();
      return condition();
    }));
  }
  void goOn(std::chrono::milliseconds time) {
    await([end = std::chrono::steady_clock::now() + time] {
      return std::chrono::steady_clock::now() > end;
    });
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
    queue_->runWhile([this] { return center.isBusy(); }, maxWait);
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

}  // namespace Varnel::Tests
