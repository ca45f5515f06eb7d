// SPDX-License-Identifier: MIT
#include <orvane/Reminders.h>

#include <chrono>
#include <optional>

#include <Varnel/Basalt/JSON.h>
#include <Varnel/Context/ApplicationData.h>
#include <Varnel/Platform/Ports/MainQueue.h>
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

// Servers answer within milliseconds, unless they have yet to be started.
constexpr std::chrono::seconds patience(3);

std::string textOf(const std::optional<Varnel::Platform::Date>& date) {
  static const Varnel::Platform::DateFormatter formatter(
      "yyyy-MM-dd HH:mm", "en_US", Varnel::Platform::processPorts().timeZones);
  return date ? formatter.string(*date) : "no date";
}

Basalt::JSON storedJSON() {
  const auto text = Varnel::ApplicationData::settings().text(periodKey);
  try {
    return Basalt::parseJSON(text.value_or(""));
  } catch (const Basalt::JSONError&) {
    return nullptr;
  }
}

}  // namespace

SchedulePeriodOption storedPeriod() {
  // The box turns any value that is no period into never.
  return Varnel::SchedulePeriodOptionBox(storedJSON()).boxed();
}

bool storePeriod(SchedulePeriodOption period, Console& console) {
  const auto error =
      Varnel::ApplicationData::settings().set(periodKey, Basalt::jsonText(period.exportJSON()));
  if (error) console.complain("cannot keep the period: " + error->localizedDescription());
  return !error;
}

void awaitDesktop(Varnel::Platform::UserNotificationCenter& center, Console& console) {
  auto& mainQueue = Varnel::Platform::processPorts().mainQueue;
  if (!mainQueue.runWhile([&center] { return center.isBusy(); }, patience))
    console.complain("the desktop does not answer; the banner of an earlier reminder may stay");
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
