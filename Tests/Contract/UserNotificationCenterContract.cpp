// SPDX-License-Identifier: MIT
#include <Tests/Contract/NotificationWorlds.h>

#include <gmock/gmock.h>

#include <functional>
#include <memory>
#include <optional>

#include <Varnel/Platform/Testing/FakeUserNotificationCenter.h>

namespace Varnel::Platform::Contract {
namespace {

using namespace std::chrono_literals;
using Failure = UserNotificationCenter::Failure;
using ::testing::ElementsAre;
using ::testing::IsEmpty;
using ::testing::UnorderedElementsAre;

// Remembers what it was told, and of what time.
class Listener final : public UserNotificationCenterDelegate {
 public:
  bool presents = true;
  std::vector<std::string> events;

  void didDeliver(UserNotificationCenter&, const UserNotification& notification) override {
    EXPECT_TRUE(notification.actualDeliveryDate);
    events.push_back("delivered " + notification.title.value_or(""));
  }
  void didActivate(UserNotificationCenter&, const UserNotification& notification) override {
    events.push_back("activated " + notification.title.value_or(""));
  }
  bool shouldPresent(UserNotificationCenter&, const UserNotification&) override { return presents; }
};

std::vector<std::string> titles(const UserNotificationCenter::Notifications& notifications) {
  std::vector<std::string> titles;
  if (!notifications) return {notifications.error().localizedDescription()};
  for (const auto& each : *notifications) titles.push_back(each.title.value_or(""));
  return titles;
}

TEST_P(UserNotificationCenterContract, DeliversAtOnceWhatItIsAskedTo) {
  UserNotificationCenter& center = world->port();
  const auto listener = std::make_shared<Listener>();
  center.setDelegate(listener);
  const UserNotification far{.identifier = "a", .title = "A", .deliveryDate = Date::max()};
  EXPECT_FALSE(center.deliverNotification(far));
  UserNotification expected = far;
  expected.actualDeliveryDate = world->now();
  EXPECT_THAT(*center.deliveredNotifications(), ElementsAre(expected));
  EXPECT_THAT(*center.scheduledNotifications(), IsEmpty());
  world->pass(3s);
  listener->presents = false;
  EXPECT_FALSE(center.deliverNotification({.identifier = "b", .title = "B"}));
  world->pass(3s);
  EXPECT_THAT(world->banners(), ElementsAre("A"));
  EXPECT_THAT(titles(center.deliveredNotifications()), ElementsAre("B", "A"));
  world->click(far);
  world->pass(0s);
  EXPECT_THAT(listener->events, ElementsAre("delivered A", "delivered B", "activated A"));
  EXPECT_THAT(titles(center.deliveredNotifications()), ElementsAre("B", "A"));
  // Nobody has to listen.
  center.setDelegate({});
  EXPECT_FALSE(center.deliverNotification({.title = "C"}));
  world->pass(3s);
  EXPECT_THAT(world->banners(), ElementsAre("A", "C"));
}

TEST_P(UserNotificationCenterContract, KeepsWhatIsScheduledUntilItsDate) {
  UserNotificationCenter& center = world->port();
  const auto listener = std::make_shared<Listener>();
  center.setDelegate(listener);
  const auto schedule = [&](const char* title, std::optional<Date> date) {
    EXPECT_FALSE(
        center.scheduleNotification({.identifier = title, .title = title, .deliveryDate = date}));
  };
  schedule("later", world->now() + 2h);
  schedule("soon", world->now() + 1h);
  EXPECT_THAT(titles(center.scheduledNotifications()), ElementsAre("soon", "later"));
  // Without a date, or with one that is past, it is due at once.
  schedule("past", world->now() - 1h);
  schedule("none", std::nullopt);
  world->pass(3s);
  EXPECT_THAT(world->banners(), ElementsAre("past", "none"));
  world->pass(1h);
  EXPECT_THAT(world->banners(), ElementsAre("past", "none", "soon"));
  EXPECT_THAT(titles(center.scheduledNotifications()), ElementsAre("later"));
  EXPECT_EQ(center.deliveredNotifications()->front().deliveryDate, world->now() - 3s);
  EXPECT_FALSE(center.removeScheduledNotification({.identifier = "later"}));
  // What was delivered has no delivery ahead.
  EXPECT_FALSE(center.removeScheduledNotification({.identifier = "soon"}));
  world->pass(2h);
  EXPECT_THAT(listener->events, ElementsAre("delivered past", "delivered none", "delivered soon"));
  EXPECT_FALSE(center.removeDeliveredNotification({.identifier = "soon"}));
  EXPECT_THAT(titles(center.deliveredNotifications()), ElementsAre("none", "past"));
}

TEST_P(UserNotificationCenterContract, TellsNotificationsByTheirIdentifiersOrElseByAllThatIsSet) {
  UserNotificationCenter& center = world->port();
  const Date date = world->now() + 1h;
  for (const char* title : {"First", "Second"}) {
    EXPECT_FALSE(
        center.scheduleNotification({.identifier = "a", .title = title, .deliveryDate = date}));
    EXPECT_FALSE(center.deliverNotification({.identifier = "a", .title = title}));
  }
  for (int i = 0; i < 2; ++i) {
    EXPECT_FALSE(center.scheduleNotification({.title = "Nameless", .deliveryDate = date}));
    EXPECT_FALSE(center.deliverNotification({.title = "Nameless"}));
  }
  const auto three = UnorderedElementsAre("Second", "Nameless", "Nameless");
  EXPECT_THAT(titles(center.scheduledNotifications()), three);
  EXPECT_THAT(titles(center.deliveredNotifications()), three);
  EXPECT_FALSE(center.removeScheduledNotification({.title = "Nameless"}));
  EXPECT_THAT(titles(center.scheduledNotifications()), three) << "its date is another";
  EXPECT_FALSE(center.removeScheduledNotification({.title = "Nameless", .deliveryDate = date}));
  EXPECT_FALSE(center.removeDeliveredNotification({.title = "Nameless"}));
  EXPECT_THAT(titles(center.scheduledNotifications()), ElementsAre("Second"));
  EXPECT_THAT(titles(center.deliveredNotifications()), ElementsAre("Second"));
}

TEST_P(UserNotificationCenterContract, DoesCallsTogetherAsOneAndShowsNothingBefore) {
  UserNotificationCenter& center = world->port();
  const UserNotification later{.identifier = "a", .title = "A", .deliveryDate = world->now() + 1h};
  EXPECT_FALSE(center.scheduleNotification(later));
  const auto change = [&](const std::function<Failure()>& end) {
    return center.change([&]() -> Failure {
      EXPECT_FALSE(center.removeScheduledNotification(later));
      EXPECT_THAT(titles(center.scheduledNotifications()), IsEmpty());
      EXPECT_FALSE(center.deliverNotification({.title = "Now"}));
      EXPECT_FALSE(center.deliverNotification({.title = "Never"}));
      EXPECT_FALSE(center.removeDeliveredNotification({.title = "Never"}));
      EXPECT_THAT(world->banners(), IsEmpty());
      return end();
    });
  };
  EXPECT_TRUE(change([] { return PlatformError("Test", 1); }));
  EXPECT_THROW(static_cast<void>(change([]() -> Failure { throw 1; })), int);
  world->pass(3s);
  EXPECT_THAT(*center.scheduledNotifications(), ElementsAre(later));
  EXPECT_THAT(world->banners(), IsEmpty());
  EXPECT_FALSE(change([] { return std::nullopt; }));
  world->pass(3s);
  EXPECT_THAT(titles(center.scheduledNotifications()), IsEmpty());
  EXPECT_THAT(world->banners(), ElementsAre("Now"));
}

TEST_P(UserNotificationCenterContract, HandsOutOnceWhatTheApplicationWasStartedFor) {
  UserNotificationCenter& center = world->port();
  EXPECT_EQ(*center.takeLaunchNotification(), std::nullopt);
  const UserNotification clicked{.identifier = "a", .title = "A", .activationToken = "token"};
  world->startBy(clicked);
  EXPECT_EQ(*center.takeLaunchNotification(), clicked);
  EXPECT_EQ(*center.takeLaunchNotification(), std::nullopt);
  world->startBy(clicked);
  world->pass(5min);
  EXPECT_EQ(*center.takeLaunchNotification(), std::nullopt) << "somebody else has started it";
}

class FakeUserNotificationCenterWorld final
    : public FakeColumn<UserNotificationCenterWorld, Testing::FakeUserNotificationCenter> {
 public:
  Date now() override { return port_.now; }
  void pass(std::chrono::seconds time) override { port_.advanceTo(port_.now + time); }
  std::vector<std::string> banners() override { return titles(port_.presented); }
  void click(const UserNotification& notification) override { port_.activate(notification); }
  void startBy(const UserNotification& notification) override { port_.startBy(notification); }
};
INSTANTIATE_TEST_SUITE_P(Fake, UserNotificationCenterContract,
                         on<FakeUserNotificationCenterWorld>());

}  // namespace
}  // namespace Varnel::Platform::Contract
