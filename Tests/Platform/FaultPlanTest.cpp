// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Testing/FaultPlan.h>

#include <future>
#include <string>
#include <vector>

#include <Varnel/Platform/Testing/FakeHTTPClient.h>
#include <Varnel/Platform/Testing/FakeProcessLauncher.h>
#include <Varnel/Platform/Testing/FakeWallClockTimer.h>
#include <Varnel/Platform/Testing/SimulatedClock.h>
#include <gtest/gtest.h>

namespace Varnel::Platform::Testing {
namespace {

using namespace std::chrono_literals;

const HTTPPost post{.url = "https://h.example", .contentType = {}, .body = {}};

TEST(FaultPlan, StrikesTheCallsThatItNamesAcrossFakes) {
  FakeHTTPClient http;
  FakeProcessLauncher launcher;
  launcher.faults = http.faults;
  const auto play = [&](Fault fault, std::size_t first, std::size_t count) {
    http.faults->plan(fault, first, count);
    std::string works;
    for (int i = 0; i < 2; ++i) {
      works += http.post(post, {}) ? 'y' : 'n';
      works += launcher.launch("/tool", {}) ? 'y' : 'n';
    }
    return works;
  };
  EXPECT_EQ(play(Fault::fails, 2, 1), "ynyy");
  EXPECT_EQ(play(Fault::absent, 7, FaultPlan::all), "yynn");
  EXPECT_EQ(play(Fault::none, 1, FaultPlan::all), "yyyy");
  EXPECT_EQ(http.faults->calls(), 12u);
}

TEST(FaultPlan, ADelayedCallWaitsUntilItIsMendedOrStopped) {
  FakeHTTPClient http;
  std::stop_source stop;
  for (const bool isStopped : {false, true}) {
    const std::size_t before = http.faults->calls();
    http.faults->plan(Fault::delays, before + 1);
    auto answer = std::async(std::launch::async,
                             [&] { return http.post(post, stop.get_token()).hasValue(); });
    http.faults->waitForCalls(before + 1);
    EXPECT_EQ(http.posts().size(), 0u + isStopped) << "it has not arrived";
    if (isStopped)
      stop.request_stop();
    else
      http.faults->mend();
    EXPECT_EQ(answer.get(), !isStopped);
  }
}

TEST(FaultPlan, ADelayedTimerRingsLateAndAMissingOneNever) {
  for (const Fault fault : {Fault::delays, Fault::absent}) {
    SimulatedClock clock;
    const Date start = clock.now();
    FakeWallClockTimer timer(clock);
    timer.faults->plan(fault, 1);
    std::vector<Date> rang;
    timer.setHandler([&] { rang.push_back(clock.now()); });
    timer.arm(start + 1h);
    timer.advanceTo(start + 3h);
    EXPECT_EQ(rang, fault == Fault::delays ? std::vector{start + 3h} : std::vector<Date>());
  }
}

TEST(FaultPlan, ASweepMakesEachCallGoWrongOnce) {
  std::string struck;
  const auto calls = sweepFaults(Fault::fails, [&](const auto& faults) {
    for (const char call : {'1', '2', '3'})
      if (faults->next() == Fault::fails) struck += call;
  });
  EXPECT_EQ(calls, 3u);
  EXPECT_EQ(struck, "123");
}

}  // namespace
}  // namespace Varnel::Platform::Testing
