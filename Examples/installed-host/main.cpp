// SPDX-License-Identifier: MIT
// Says who it is, in a text, a link, the log and a kept reminder.
#include <iostream>
#include <memory>

#include <Basalt/Columns.h>
#include <Platform/Window.h>
#include <Varnel/Context/Globals.h>
#include <Varnel/Identification/Links/TDSService.h>
#include <Varnel/Identification/User/UserIdentificationInfo.h>
#include <Varnel/Identification/User/UserIdentificator.h>
#include <Varnel/Modules/VarnelModule.h>
#include <Varnel/Platform/Ports/UserNotificationCenter.h>
#include <Varnel/Reminders/NextDayCleanupReminderInfo.h>
#include <Varnel/Reminders/SchedulePeriodOption.h>
#include <Varnel/Reminders/UserNotificationRouter.h>

using namespace Varnel;

int main() {
  const TDSService links(
      std::make_shared<TDSConfiguration>("Host", "host"),
      std::make_shared<UserIdentificationInfo>(std::make_shared<UserIdentificator>()));
  const auto link = links.buildURL("buy", {});
  UserNotificationRouter::defaultUserNotificationCenter().scheduleNotification(
      NextDayCleanupReminderInfo(1'000'000, 2'000'000).makeUserNotification());
  std::cout << Host::windowTitle() << ": "
            << Globals::substitutingApplicationName("Welcome to Orvane 2") << ' '
            << Globals::applicationVersionString() << " on version "
            << VarnelModule::instance()->version() << " of the framework\n"
            << (link ? link->absoluteString() : "no link") << '\n'
            << SchedulePeriodOption::default_().accessibilityIdentifier() << '\n';
}
