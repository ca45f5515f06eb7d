// SPDX-License-Identifier: MIT
#include <orvane/Reminders.h>

#include <optional>

#include <Varnel/Basalt/JSON.h>
#include <Varnel/Platform/Ports/Ports.h>
#include <Varnel/Platform/Ports/UserDefaults.h>
#include <Varnel/Platform/Ports/UserNotificationCenter.h>
#include <Varnel/Platform/Text/DateFormatter.h>
#include <Varnel/Platform/Text/VisibleText.h>
#include <Varnel/Reminders/SchedulePeriodOptionBox.h>

namespace Orvane {
namespace {

using Varnel::SchedulePeriodOption;
using Varnel::Platform::UserNotification;
using Varnel::Platform::visibleText;

constexpr const char* periodKey = "schedulePeriod";

std::string textOf(const std::optional<Varnel::Platform::Date>& date) {
  static const Varnel::Platform::DateFormatter formatter(
      "yyyy-MM-dd HH:mm", "en_US", Varnel::Platform::processPorts().timeZones);
  return date ? formatter.string(*date) : "no date";
}

Basalt::JSON storedJSON() {
  const auto text = Varnel::Platform::processPorts().userDefaults.text(periodKey);
  try {
    return Basalt::parseJSON(text.value_or(""));
  } catch (const Basalt::JSONError&) {
    return nullptr;
  }
}

}  // namespace

SchedulePeriodOption storedPeriod() {
  // The box takes whatever is no period for never.
  return Varnel::SchedulePeriodOptionBox(storedJSON()).boxed();
}

void storePeriod(SchedulePeriodOption period) {
  Varnel::Platform::processPorts().userDefaults.set(periodKey,
                                                    Basalt::jsonText(period.exportJSON()));
}

std::string lineOf(const UserNotification& notification) {
  return visibleText(notification.identifier.value_or("(no identifier)") + ": " +
                     notification.title.value_or("") + " - " +
                     notification.informativeText.value_or(""));
}

std::string statusText(Varnel::Platform::UserNotificationCenter& center) {
  std::string text = "period: " + storedPeriod().description() + "\n";
  for (const UserNotification& notification : center.scheduledNotifications())
    text += "scheduled " + textOf(notification.deliveryDate) + "  " + lineOf(notification) + "\n";
  for (const UserNotification& notification : center.deliveredNotifications())
    text +=
        "delivered " + textOf(notification.actualDeliveryDate) + "  " + lineOf(notification) + "\n";
  return text;
}

}  // namespace Orvane
