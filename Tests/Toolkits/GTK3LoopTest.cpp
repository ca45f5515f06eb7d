// SPDX-License-Identifier: MIT
#include <Varnel/GTK3/ApplicationActivity.h>
#include <Varnel/GTK3/DisplayTexts.h>
#include <Varnel/GTK3/LatestValue.h>
#include <Varnel/GTK3/OwnedPosts.h>
#include <Varnel/GTK3/RouterAtStartup.h>
#include <Varnel/Platform/Testing/FakeMainQueue.h>
#include <Varnel/Platform/Testing/FakePorts.h>
#include <Varnel/Reminders/UserNotificationRouter.h>
#include <giomm.h>
#include <glib.h>
#include <gtest/gtest.h>
#include <time.h>

#include <algorithm>
#include <memory>
#include <optional>
#include <thread>

// What needs a main loop and no screen.
namespace Varnel::GTK3 {
namespace {

double threadSeconds() {
  timespec now{};
  ::clock_gettime(CLOCK_THREAD_CPUTIME_ID, &now);
  return static_cast<double>(now.tv_sec) + static_cast<double>(now.tv_nsec) * 1e-9;
}

TEST(OwnedPosts, ThoseOfAnOwnerThatHasGoneAreDropped) {
  Platform::Testing::FakeMainQueue queue;
  int runs = 0;
  auto owner = std::make_unique<OwnedPosts>(queue);
  const auto post = owner->sender();
  const auto count = [&runs] { ++runs; };
  std::jthread([&] { post(count); }).join();
  queue.drain();
  EXPECT_EQ(runs, 1);

  post(count);
  owner->drop();
  owner->post([&] { runs += 10; });
  queue.drain();
  EXPECT_EQ(runs, 11);

  owner->post(count);
  owner.reset();
  post(count);
  queue.drain();
  EXPECT_EQ(runs, 11);
}

TEST(LatestValue, ManyValuesNeitherKeepTheWindowFromDrawingNorLoseTheLast) {
  constexpr int last = 400'000;
  int shown = 0;
  int calls = 0;
  LatestValue<int> value([&](const int& now) { shown = now, ++calls; });
  // As a window that redraws all the time.
  int drawings = 0;
  g_timeout_add_full(
      G_PRIORITY_HIGH_IDLE + 20, 1,
      [](gpointer count) -> gboolean { return ++*static_cast<int*>(count), G_SOURCE_CONTINUE; },
      &drawings, nullptr);
  double longestTurn = 0;
  const auto turn = [&] {
    const double before = threadSeconds();
    g_main_context_iteration(nullptr, TRUE);
    longestTurn = std::max(longestTurn, threadSeconds() - before);
  };
  {
    const std::jthread sender([send = value.sender()] {
      for (int i = 1; i <= last; ++i) send(i);
    });
    while (shown < last) turn();
  }
  g_source_remove_by_user_data(&drawings);
  EXPECT_EQ(shown, last);
  EXPECT_LT(longestTurn, 0.05);
  EXPECT_GT(drawings, 0);
  EXPECT_LE(calls, drawings);
  RecordProperty("calls", calls);
  std::printf("%d values, %d calls, %d drawings, longest turn %.3f ms\n", last, calls, drawings,
              longestTurn * 1e3);
}

TEST(LatestValue, WhatIsFlushedDoesNotComeAgainAndWhatComesLateNotAtAll) {
  std::vector<int> shown;
  auto value = std::make_unique<LatestValue<int>>([&](const int& now) { shown.push_back(now); });
  const auto send = value->sender();
  send(1);
  send(2);
  value->flush();
  PacedCall wait([] {}, std::chrono::milliseconds(100));
  bool isOver = false;
  PacedCall timer([&] { isOver = true; }, std::chrono::milliseconds(100));
  const auto waitForTimer = [&] {
    isOver = false;
    timer.requester()();
    while (!isOver) g_main_context_iteration(nullptr, TRUE);
  };
  waitForTimer();
  EXPECT_EQ(shown, std::vector{2});
  send(3);
  value.reset();
  send(4);
  waitForTimer();
  EXPECT_EQ(shown, std::vector{2});
}

TEST(RouterAtStartup, OnlyTheStartUpMakesTheListener) {
  Gio::init();
  Platform::Testing::FakePorts fakes;
  const auto ports = fakes.ports();
  auto application = Gio::Application::create("", Gio::APPLICATION_NON_UNIQUE);
  int subscriptions = 0;
  const RouterAtStartup routing(*application.get(), ports, [&](UserNotificationRouter& router) {
    EXPECT_EQ(&router, routing.router());
    ++subscriptions;
  });
  EXPECT_EQ(routing.router(), nullptr);
  application->register_application();
  EXPECT_NE(routing.router(), nullptr);
  EXPECT_EQ(subscriptions, 1);
}

TEST(DisplayTexts, AnyBytesOfAPathCanBeShown) {
  const auto text = [](const char* path, PathKind kind) {
    return pathText(Platform::URL::fileURLWithPath(path), kind);
  };
  EXPECT_EQ(text("/nowhere/a_b", PathKind::folder), "/nowhere/a_b/");
  EXPECT_EQ(text("/nowhere/a\xff\nb", PathKind::file), "/nowhere/a\\xFF\\nb");
  EXPECT_EQ(text("/", PathKind::folder), "/");
}

}  // namespace
}  // namespace Varnel::GTK3
