// SPDX-License-Identifier: MIT
// A reminder of the host's own: plans it for tomorrow, and shows what is planned. Plans are kept in
// the user's state folder, and delivered whether this program runs or not.
#include <chrono>
#include <iostream>

#include <Varnel/Platform/Ports/Clock.h>
#include <Varnel/Platform/Ports/MainQueue.h>
#include <Varnel/Platform/Ports/Ports.h>
#include <Varnel/Platform/Ports/UserNotificationCenter.h>
#include <Varnel/Reminders/UserNotificationRouter.h>

using namespace Varnel;
using namespace std::chrono_literals;

int main() {
  UserNotificationRouter router;  // at launch: it becomes the center's delegate
  router.register_("com.example.backup", [](const auto& notification, auto kind) {
    if (kind != UserNotificationRouter::EventKind::didDeliver)
      std::cout << "clicked: " << *notification.title << '\n';
  });
  Platform::UserNotificationCenter& center = router.userNotificationCenter();
  if (const auto launch = center.takeLaunchNotification(); launch && *launch)
    router.handleLaunch(**launch);  // a click has started this program

  const auto failure = center.scheduleNotification(
      {.identifier = "com.example.backup",
       .title = "Nothing is backed up yet",
       .informativeText = "Plug a disk in and choose what to keep.",
       .actionButtonTitle = "Choose",
       .deliveryDate = Platform::processPorts().clock.get().now() + 24h});
  if (failure) {
    std::cerr << failure->localizedDescription() << '\n';
    return 1;
  }
  // Lets what waits on the main thread run: events, and the word to whoever delivers.
  Platform::processPorts().mainQueue.get().runWhile([&] { return center.isBusy(); }, 3s);
  const auto planned = center.scheduledNotifications();
  if (!planned) return 1;
  for (const auto& each : *planned) std::cout << "planned: " << *each.title << '\n';
}
