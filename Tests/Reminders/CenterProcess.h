// SPDX-License-Identifier: MIT
#pragma once

#include <gtest/gtest.h>

#include <filesystem>
#include <memory>
#include <optional>
#include <string>
#include <utility>
#include <vector>

#include <Tests/Support/Zones.h>
#include <Varnel/Platform/Generic/ScheduledNotificationCenter.h>
#include <Varnel/Platform/POSIX/Adapters.h>
#include <Varnel/Platform/Ports/PrivateFiles.h>
#include <Varnel/Platform/Testing/CapturedOutput.h>
#include <Varnel/Platform/Testing/FakeMainQueue.h>
#include <Varnel/Platform/Testing/FakeNotificationServer.h>
#include <Varnel/Platform/Testing/FakeUser.h>
#include <Varnel/Platform/Testing/FakeWallClockTimer.h>

namespace Varnel::Platform::Testing {

/// Remembers what it was told.
class Listener final : public UserNotificationCenterDelegate {
 public:
  bool presents = true;
  bool throws = false;
  std::vector<std::string> events;

  void didDeliver(UserNotificationCenter&, const UserNotification& notification) override {
    events.push_back("delivered " + *notification.title);
  }
  void didActivate(UserNotificationCenter&, const UserNotification& notification) override {
    events.push_back("activated " + *notification.title);
  }
  bool shouldPresent(UserNotificationCenter&, const UserNotification&) override {
    if (throws) throw 1;
    return presents;
  }
};

/// A process of the product, on the store that all share.
struct Process {
  using Desktop = std::shared_ptr<FakeNotificationServer>;

  Process(const std::filesystem::path& file, Date now,
          Desktop shared = std::make_shared<FakeNotificationServer>())
      : clock(now),
        desktop(std::move(shared)),
        center({clock, locale, zones, queue, *files, log, server, timer}, file.string()) {}

  void listen() { center.setDelegate(listener); }
  void schedule(const UserNotification& notification) {
    EXPECT_EQ(textOf(center.scheduleNotification(notification)), "");
  }
  void deliver(const UserNotification& notification) {
    EXPECT_EQ(textOf(center.deliverNotification(notification)), "");
  }
  [[nodiscard]] std::vector<UserNotification> scheduled() {
    return center.scheduledNotifications().valueOr({});
  }
  [[nodiscard]] std::vector<UserNotification> delivered() {
    return center.deliveredNotifications().valueOr({});
  }
  static std::string textOf(const std::optional<PlatformError>& error) {
    return error ? error->localizedDescription() : "";
  }

  SimulatedClock clock;
  FakeUserLocale locale;
  FakeTimeZones zones = Tests::zonesOf2026();
  FakeMainQueue queue;
  const std::unique_ptr<PrivateFiles> files = POSIX::makePrivateFiles();
  CapturedSystemLog log;
  const Desktop desktop;  ///< It outlives the process.
  FakeNotificationServer& server = *desktop;
  FakeWallClockTimer timer{clock};
  ScheduledNotificationCenter center;
  const std::shared_ptr<Listener> listener = std::make_shared<Listener>();
};

}  // namespace Varnel::Platform::Testing
