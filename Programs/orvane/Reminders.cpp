// SPDX-License-Identifier: MIT
#include <orvane/Reminders.h>

#include <optional>

#include <Varnel/Basalt/JSON.h>
#include <Varnel/Context/ApplicationData.h>
#include <Varnel/Platform/Ports/Ports.h>
#include <Varnel/Platform/Ports/UserDefaults.h>
#include <Varnel/Platform/Ports/UserNotificationCenter.h>
#include <Varnel/Platform/Text/DateFormatter.h>
#include <Varnel/Platform/Text/VisibleText.h>
#include <Varnel/Reminders/SchedulePeriodOptionBox.h>
#include <orvane/Console.h>

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

}  // namespace

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

bool writeStatus(Varnel::Platform::UserNotificationCenter& center, Console& console) {
  const auto scheduled = center.scheduledNotifications();
  const auto delivered = center.deliveredNotifications();
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
