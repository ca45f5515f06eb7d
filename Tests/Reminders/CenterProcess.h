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
#include <Varnel/Platform/Generic/InProcessDeliverer.h>
#include <Varnel/Platform/Generic/ScheduledNotificationCenter.h>
#include <Varnel/Platform/Generic/SharedWallClockTimer.h>
#include <Varnel/Platform/POSIX/Adapters.h>
#include <Varnel/Platform/Ports/PrivateFiles.h>
#include <Varnel/Platform/Testing/CapturedOutput.h>
#include <Varnel/Platform/Testing/FakeMainQueue.h>
#include <Varnel/Platform/Testing/FakeNotificationServer.h>
#include <Varnel/Platform/Testing/FakeUser.h>
#include <Varnel/Platform/Testing/FakeWallClockTimer.h>
#include <Varnel/Platform/Testing/FaultyPrivateFiles.h>

namespace Varnel::Platform::Testing {

/// Remembers what it was told.
class Listener final : public UserNotificationCenterDelegate {
 public:
  bool presents = true;
  std::vector<std::string> events;

  void didDeliver(UserNotificationCenter&, const UserNotification& notification) override {
    events.push_back("delivered " + *notification.title);
  }
  void didActivate(UserNotificationCenter&, const UserNotification& notification) override {
    events.push_back("activated " + *notification.title);
  }
  bool shouldPresent(UserNotificationCenter&, const UserNotification&) override { return presents; }
};

/// A process of the product, on the store that all share.
struct Process {
  using Desktop = std::shared_ptr<FakeNotificationServer>;

  Process(const std::filesystem::path& file, Date now,
          Desktop shared = std::make_shared<FakeNotificationServer>())
      : clock(now),
        desktop(std::move(shared)),
        deliverer({clock, locale, zones, queue, files, log, server, *dates}, file.string()),
        center({clock, locale, zones, files, log, *pauses}, file.string(), source, deliverer) {}

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
  /// Until the server and the main queue have nothing left to do.
  void settle() {
    do server.report();
    while (queue.drain());
  }
  static std::string textOf(const std::optional<PlatformError>& error) {
    return error ? error->localizedDescription() : "";
  }

  SimulatedClock clock;
  FakeUserLocale locale;
  FakeTimeZones zones = Tests::zonesOf2026();
  FakeMainQueue queue;
  const std::unique_ptr<PrivateFiles> realFiles = POSIX::makePrivateFiles();
  FaultyPrivateFiles files{*realFiles};
  CapturedSystemLog log;
  const Desktop desktop;  ///< It outlives the process.
  FakeNotificationServer& server = *desktop;
  FakeWallClockTimer timer{clock};
  SharedWallClockTimer timers{clock, timer};
  const std::unique_ptr<WallClockTimer> dates = timers.share();
  const std::unique_ptr<WallClockTimer> pauses = timers.share();
  const NotificationSource source{.identifier = "com.example.Fotovia", .name = "Fotovia"};
  InProcessDeliverer deliverer;
  ScheduledNotificationCenter center;
  const std::shared_ptr<Listener> listener = std::make_shared<Listener>();
};

}  // namespace Varnel::Platform::Testing
