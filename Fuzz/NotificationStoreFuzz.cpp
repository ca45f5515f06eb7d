// SPDX-License-Identifier: MIT
// The store of notifications. What was planned in a file, whatever it held, is found in it.
#include <algorithm>

#include <Fuzz/ForgedDatabase.h>
#include <Varnel/Platform/Generic/NotificationStore.h>
#include <Varnel/Platform/POSIX/Adapters.h>
#include <Varnel/Platform/Testing/CapturedOutput.h>
#include <Varnel/Platform/Testing/FakeTimeZones.h>
#include <Varnel/Platform/Text/Calendar.h>

using namespace Varnel::Platform;
using namespace std::chrono_literals;

static void fuzz(std::string_view input) {
  static const auto files = POSIX::makePrivateFiles();
  static const Testing::FakeTimeZones zones;
  static const Calendar calendar("en_US", "UTC", zones);
  const Date now(490'000h);
  Testing::CapturedSystemLog log;
  const auto open = [&](const std::string& path) {
    return NotificationStore({*files, log}, path, Migrating::allowed);
  };
  const auto notification = [&](const char* identifier, std::chrono::hours ahead) {
    UserNotification planned{.identifier = identifier, .title = "Title"};
    planned.deliveryDate = now + ahead;
    planned.deliveryRepeatInterval = DateComponents{.day = 7};
    return planned;
  };
  static const ForgedDatabase database("Notifications.db", [&](const std::string& path) {
    NotificationStore store = open(path);
    require(!store.plan(notification("a", -1h), now - 2h, calendar));
    require(!store.plan(notification("b", 1h), now, calendar));
    require(!store.keepLaunch(notification("c", 0h), now));
    require(!store.keepSource({.identifier = "com.quennel.Orvane", .name = "Orvane"}));
  });
  database.forge(input);
  {
    NotificationStore store = open(database.path());
    const std::vector<DeliveryState> all = {DeliveryState::planned, DeliveryState::due,
                                            DeliveryState::hidden,  DeliveryState::toShow,
                                            DeliveryState::shown,   DeliveryState::expired,
                                            DeliveryState::removed};
    static_cast<void>(store.deliveries(all));
    static_cast<void>(store.claimDue(now, calendar));
    static_cast<void>(store.source());
    static_cast<void>(store.takeLaunch(now));
    if (store.plan(notification("new", 2h), now, calendar)) return;
  }
  const auto found = open(database.path()).deliveries({DeliveryState::planned});
  require(found && std::any_of(found->begin(), found->end(), [](const Delivery& delivery) {
            return delivery.schedule.notification.identifier == "new";
          }));
}
