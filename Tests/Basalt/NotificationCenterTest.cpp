// SPDX-License-Identifier: MIT
#include <Varnel/Basalt/NotificationCenter.h>

#include <gtest/gtest.h>

#include <atomic>
#include <optional>
#include <vector>

#include <Tests/Support/Crew.h>

namespace Basalt {
namespace {

TEST(NotificationCenter, TellsTheObserversOfANameInOrder) {
  NotificationCenter center;
  std::vector<int> calls;
  const auto first =
      center.addObserver("mounted", [&](const Notification&) { calls.push_back(1); });
  const auto other =
      center.addObserver("unmounted", [&](const Notification&) { calls.push_back(2); });
  auto last = center.addObserver("mounted", [&](const Notification&) { calls.push_back(3); });
  center.post({.name = "mounted", .userInfo = {}});
  EXPECT_EQ(calls, (std::vector{1, 3}));

  auto heir = center.addObserver("mounted", [&](const Notification&) { calls.push_back(4); });
  last = std::move(heir);
  center.post({.name = "mounted", .userInfo = {}});
  EXPECT_EQ(calls, (std::vector{1, 3, 1, 4})) << "the former one is gone at once";
}

TEST(NotificationCenter, LetsHandlersComeAndGoDuringAPost) {
  NotificationCenter center;
  int calls = 0;
  std::vector<NotificationCenter::Observer> added;
  std::optional<NotificationCenter::Observer> self, later;
  self = center.addObserver("changed", [&](const Notification& notification) {
    ++calls;
    added.push_back(center.addObserver("changed", [&](const Notification&) { calls += 100; }));
    self.reset();
    later.reset();
    center.post({.name = "nested", .userInfo = notification.userInfo});
  });
  later = center.addObserver("changed", [&](const Notification&) { calls += 10; });
  const auto nested = center.addObserver("nested", [&](const Notification&) { calls += 1000; });
  center.post({.name = "changed", .userInfo = {}});
  EXPECT_EQ(calls, 1001) << "one that was dropped is not called, one that was added not yet";
  center.post({.name = "changed", .userInfo = {}});
  EXPECT_EQ(calls, 1101);
}

TEST(NotificationCenter, ServesSeveralThreadsAndMayGoBeforeItsObservers) {
  std::optional<NotificationCenter::Observer> survivor;
  std::atomic<int> calls = 0;
  {
    NotificationCenter center;
    survivor = center.addObserver("tick", [&](const Notification&) { ++calls; });
    Varnel::Tests::Crew(3, [&](unsigned) {
      for (int i = 0; i < 500; ++i) {
        const auto passing = center.addObserver("tick", [](const Notification&) {});
        center.post({.name = "tick", .userInfo = {}});
      }
    });
  }
  EXPECT_EQ(calls, 1500);
}

}  // namespace
}  // namespace Basalt
