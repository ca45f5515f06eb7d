// SPDX-License-Identifier: MIT
// PlanningProcess COUNT [front|behind]: plans that many notifications for now, a few at a time, and
// prints the titles of those that are kept, a line each. Then it listens until it is killed. In
// front of other applications, or behind them, it ends when one of them was delivered.
#include <unistd.h>

#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <string>
#include <string_view>

#include <Varnel/Platform/Ports/Application.h>
#include <Varnel/Platform/Ports/Clock.h>
#include <Varnel/Platform/Ports/MainQueue.h>
#include <Varnel/Platform/Ports/Ports.h>
#include <Varnel/Platform/Ports/UserNotificationCenter.h>
#include <Varnel/Reminders/UserNotificationRouter.h>

int main(int count, char** arguments) {
  using namespace Varnel;
  if (count < 2) return EXIT_FAILURE;
  const Platform::Clock& clock = Platform::processPorts().clock;
  Platform::MainQueue& mainQueue = Platform::processPorts().mainQueue;
  UserNotificationRouter router;
  auto& center = router.userNotificationCenter();
  const int total = std::atoi(arguments[1]);
  const std::string_view place = count > 2 ? arguments[2] : "";
  Platform::processPorts().application.get().setActive(place == "front");
  bool isDelivered = false;
  constexpr int step = 20;
  for (int kept = 0; kept < total; kept += step) {
    std::string titles;
    const auto failure = center.change([&]() -> Platform::UserNotificationCenter::Failure {
      titles.clear();
      for (int i = kept; i < std::min(kept + step, total); ++i) {
        const std::string title = std::to_string(::getpid()) + "." + std::to_string(i);
        if (!place.empty()) router.register_(title, [&](const auto&, auto) { isDelivered = true; });
        if (auto error = center.scheduleNotification(
                {.identifier = title, .title = title, .deliveryDate = clock.now()}))
          return error;
        titles += title + "\n";
      }
      return std::nullopt;
    });
    // The store may be busy.
    if (failure) kept -= step;
    if (!failure) std::fputs(titles.c_str(), stdout);
    std::fflush(stdout);
    while (mainQueue.drain()) continue;
  }
  mainQueue.runWhile([&] { return !isDelivered || center.isBusy(); });
}
