// SPDX-License-Identifier: MIT
#include <Varnel/Reminders/UserNotificationRouter.h>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <Tests/Support/Crew.h>
#include <Varnel/Basalt/MainQueueExecutor.h>
#include <Varnel/Platform/Testing/FakeApplication.h>
#include <Varnel/Platform/Testing/FakeMainQueue.h>
#include <Varnel/Platform/Testing/FakeUserNotificationCenter.h>

namespace Varnel {
namespace {

using Platform::UserNotification;
using Router = UserNotificationRouter;
using Kind = Router::EventKind;
using ::testing::ElementsAre;
using ::testing::IsEmpty;
using ::testing::SizeIs;

auto sameAs(const UserNotification& notification) {
  return testing::Truly([=](const UserNotification& other) {
    return Platform::isSameNotification(notification, other);
  });
}

class UserNotificationRouterTest : public ::testing::Test {
 protected:
  Router::Handler note(std::string name) {
    return [this, name = std::move(name)](const UserNotification& received, Kind kind) {
      EXPECT_TRUE(queue.isCurrent());
      events.push_back(name + " " + received.title.value_or("") + " " +
                       std::to_string(static_cast<int>(kind)));
    };
  }

  Platform::Testing::FakeUserNotificationCenter center;
  Platform::Testing::FakeApplication application;
  Platform::Testing::FakeMainQueue queue;
  Router router{{center, application, queue}};
  const UserNotification notification{.identifier = "a", .title = "A"};
  std::vector<std::string> events;
};

TEST_F(UserNotificationRouterTest, ReachesAllHandlersOfTheIdentifierInTheirOrder) {
  router.register_("a", note("first"));
  router.register_("b", note("other"));
  router.register_("a", note("second"));
  EXPECT_EQ(router.channel("a"), router.channel("a"));
  EXPECT_FALSE(center.deliverNotification(notification));
  center.activate(notification);
  router.handleLaunch(notification);
  EXPECT_THAT(events, IsEmpty());
  queue.drain();
  EXPECT_THAT(events, ElementsAre("first A 1", "second A 1", "first A 2", "second A 2", "first A 0",
                                  "second A 0"));
  EXPECT_EQ(Router::eventKindWithRawValue(2), Kind::didActivate);
  EXPECT_EQ(Router::eventKindWithRawValue(3), std::nullopt);
  EXPECT_EQ(Router::eventKindWithRawValue(-1), std::nullopt);
}

TEST_F(UserNotificationRouterTest, ALaunchWaitsForACenterThatCannotBeAsked) {
  router.register_("a", note("launched"));
  center.startBy(notification);
  {
    Router shortLived({center, application, queue});
    center.faults->plan(Platform::Testing::Fault::fails, 1, 3);
    for (Router* const each : {&shortLived, &router}) each->handlePendingLaunch();
  }
  center.retry();
  EXPECT_EQ(center.retryCount(), 1u);
  center.retry();
  router.handlePendingLaunch();
  queue.drain();
  EXPECT_THAT(events, ElementsAre("launched A 0"));
}

TEST_F(UserNotificationRouterTest, DropsWhatNobodyAskedForAndReplaysNothing) {
  center.activate(notification);
  router.register_("a", note("late"));
  center.activate({.title = "Nameless"});
  router.handleLaunch({.identifier = "A"});
  queue.drain();
  EXPECT_THAT(events, IsEmpty());
}

TEST_F(UserNotificationRouterTest, HandlersMaySubscribeWhileAnEventIsDelivered) {
  router.register_("a", [&](const UserNotification&, Kind) {
    router.register_("a", note("new"));
    router.handleLaunch({.identifier = "b"});
  });
  router.register_("b", note("nested"));
  center.activate(notification);
  queue.drain();
  EXPECT_THAT(events, ElementsAre("nested  0"));
  center.activate(notification);
  queue.drain();
  EXPECT_THAT(events, ElementsAre("nested  0", "new A 2", "nested  0"));
}

TEST_F(UserNotificationRouterTest, ASubscriptionEndsWithItsContextAlsoForEventsOnTheirWay) {
  class Context final : public Basalt::ExecutionContext {
   public:
    explicit Context(Platform::MainQueue& queue)
        : ExecutionContext(std::make_shared<Basalt::MainQueueExecutor>(queue)) {}
  };
  auto first = std::make_unique<Context>(queue);
  auto second = std::make_unique<Context>(queue);
  int count = 0;
  router.channel("a").onUpdate(*first, [&](const Router::Event&) {
    ++count;
    second.reset();
  });
  router.channel("a").onUpdate(*second, [&](const Router::Event&) { ADD_FAILURE(); });
  center.activate(notification);
  queue.drain();
  center.activate(notification);
  first.reset();
  queue.drain();
  EXPECT_EQ(count, 1);
}

TEST_F(UserNotificationRouterTest, ShowsBannersOnlyWhileTheUserIsElsewhere) {
  EXPECT_FALSE(center.deliverNotification(notification));
  application.setActive(true);
  EXPECT_FALSE(center.deliverNotification(notification));
  EXPECT_THAT(center.presented, SizeIs(1));
  application.setActive(false);
  EXPECT_FALSE(center.deliverNotification(notification));
  EXPECT_THAT(center.presented, SizeIs(2));
}

TEST_F(UserNotificationRouterTest, BothRemovalsTakeTheirCandidatesFromTheDeliveredList) {
  const UserNotification other{.identifier = "b"};
  for (const auto& each : {notification, other}) EXPECT_FALSE(center.scheduleNotification(each));
  EXPECT_FALSE(router.removeScheduledNotifications("a"));
  EXPECT_THAT(*center.scheduledNotifications(), SizeIs(2));
  for (const auto& each : {notification, other}) EXPECT_FALSE(center.deliverNotification(each));
  EXPECT_FALSE(router.removeScheduledNotifications("a"));
  EXPECT_THAT(*center.scheduledNotifications(), ElementsAre(sameAs(other)));
  EXPECT_THAT(*center.deliveredNotifications(), SizeIs(2));
  EXPECT_FALSE(router.removeDeliveredNotifications("a"));
  EXPECT_THAT(*center.deliveredNotifications(), ElementsAre(sameAs(other)));
  EXPECT_THAT(*center.scheduledNotifications(), ElementsAre(sameAs(other)));
  center.faults->plan(Platform::Testing::Fault::fails, 1);
  EXPECT_TRUE(router.removeDeliveredNotifications("b"));
}

TEST_F(UserNotificationRouterTest, IsHeldWeakly) {
  {
    const Router shortLived({center, application, queue});
    EXPECT_TRUE(center.delegate());
  }
  EXPECT_FALSE(center.delegate());
}

TEST_F(UserNotificationRouterTest, AnyThreadMayRegisterWhileEventsCome) {
  constexpr int eventCount = 200;
  std::vector<int> counts(4, 0);
  Tests::Crew threads(4, [&](unsigned i) {
    for (int n = 0; n < eventCount; ++n) static_cast<void>(router.channel("x" + std::to_string(n)));
    router.register_("a", [&counts, i](const UserNotification&, Kind) { ++counts[i]; });
  });
  for (int n = 0; n < eventCount; ++n) {
    router.handleLaunch(notification);
    queue.drain();
  }
  threads.join();
  const auto before = counts;
  router.handleLaunch(notification);
  queue.drain();
  for (std::size_t i = 0; i < counts.size(); ++i) EXPECT_EQ(counts[i], before[i] + 1);
}

}  // namespace
}  // namespace Varnel
