// SPDX-License-Identifier: MIT
#include <orvane/Reminders.h>

#include <algorithm>
#include <memory>
#include <optional>

#include <Varnel/Basalt/JSON.h>
#include <Varnel/Context/ApplicationData.h>
#include <Varnel/Platform/Ports/MainQueue.h>
#include <Varnel/Platform/Ports/Ports.h>
#include <Varnel/Platform/Ports/UserDefaults.h>
#include <Varnel/Platform/Text/DateFormatter.h>
#include <Varnel/Platform/Text/VisibleText.h>
#include <Varnel/Reminders/SchedulePeriodOptionBox.h>
#include <orvane/Console.h>

namespace Orvane {
namespace {

using Varnel::SchedulePeriodOption;
using Varnel::Platform::UserNotification;
using Varnel::Platform::UserNotificationCenter;
using Varnel::Platform::visibleText;

constexpr const char* periodKey = "schedulePeriod";

std::string textOf(const std::optional<Varnel::Platform::Date>& date) {
  static const Varnel::Platform::DateFormatter formatter(
      "yyyy-MM-dd HH:mm", "en_US", Varnel::Platform::processPorts().timeZones);
  return date ? formatter.string(*date) : "no date";
}

}  // namespace

std::chrono::milliseconds patience() {
  using std::chrono::steady_clock;
  static const auto end = steady_clock::now() + std::chrono::seconds(3);
  return std::max(std::chrono::ceil<std::chrono::milliseconds>(end - steady_clock::now()),
                  std::chrono::milliseconds(0));
}

std::optional<SchedulePeriodOption> storedPeriod() {
  const auto text = Varnel::ApplicationData::settings().text(periodKey);
  if (!text) return std::nullopt;
  try {
    // The box turns any value that is no period into never.
    return Varnel::SchedulePeriodOptionBox(Basalt::parseJSON(*text)).boxed();
  } catch (const Basalt::JSONError&) {
    return std::nullopt;
  }
}

bool storePeriod(SchedulePeriodOption period, Console& console) {
  const auto error =
      Varnel::ApplicationData::settings().set(periodKey, Basalt::jsonText(period.exportJSON()));
  if (error) console.complain("cannot keep the period: " + error->localizedDescription());
  return !error;
}

std::string lineOf(const UserNotification& notification) {
  return visibleText(notification.identifier.value_or("(no identifier)") + ": " +
                     notification.title.value_or("") + " - " +
                     notification.informativeText.value_or(""));
}

void removeClicked(UserNotificationCenter& center, const UserNotification& notification) {
  if (center.removeDeliveredNotification(notification))
    center.retryLater([&center, notification] { removeClicked(center, notification); });
}

UserNotificationCenter::Notifications readPatiently(UserNotificationCenter& center,
                                                    NotificationList list) {
  auto found = (center.*list)();
  if (found) return found;
  const auto isTime = std::make_shared<bool>(false);
  center.retryLater([isTime] { *isTime = true; });
  Varnel::Platform::processPorts().mainQueue.get().runWhile([&] { return !*isTime; }, patience());
  return (center.*list)();
}

bool writeStatus(UserNotificationCenter& center, Console& console) {
  const auto scheduled = readPatiently(center, &UserNotificationCenter::scheduledNotifications);
  const auto delivered = readPatiently(center, &UserNotificationCenter::deliveredNotifications);
  if (!scheduled || !delivered) {
    const auto& error = scheduled ? delivered.error() : scheduled.error();
    console.complain("the reminders cannot be read: " + error.localizedDescription());
    return false;
  }
  std::string text =
      "period: " + storedPeriod().value_or(SchedulePeriodOption::never).description() + "\n";
  for (const UserNotification& notification : *scheduled)
    text += "scheduled " + textOf(notification.deliveryDate) + "  " + lineOf(notification) + "\n";
  for (const UserNotification& notification : *delivered)
    text +=
        "delivered " + textOf(notification.actualDeliveryDate) + "  " + lineOf(notification) + "\n";
  return console.writeResult(text);
}

}  // namespace Orvane
