// SPDX-License-Identifier: MIT
#include <Varnel/Reminders/NextDayCleanupReminderInfo.h>

#include <Varnel/Modules/VarnelModule.h>
#include <Varnel/Platform/Ports/Clock.h>
#include <Varnel/Platform/Ports/Ports.h>
#include <Varnel/Platform/Ports/TimeZones.h>
#include <Varnel/Platform/Ports/UserLocale.h>
#include <Varnel/Platform/Text/ByteCountFormatter.h>
#include <Varnel/Platform/Text/Calendar.h>
#include <Varnel/Platform/Text/TextFormat.h>

namespace Varnel {

const std::string& NextDayCleanupReminderInfo::userNotificationIdentifier() {
  static const std::string& identifier =
      *new std::string("com.quennel.Orvane2.daily-cleanup-reminder");
  return identifier;
}

Platform::UserNotification NextDayCleanupReminderInfo::makeUserNotification() const {
  return makeUserNotification(Platform::processPorts());
}

Platform::UserNotification NextDayCleanupReminderInfo::makeUserNotification(
    const Platform::Ports& ports) const {
  return makeUserNotification(
      {ports.clock, ports.userLocale, ports.timeZones, *VarnelModule::instance()});
}

Platform::UserNotification NextDayCleanupReminderInfo::makeUserNotification(Ports ports) const {
  const auto localized = [&](const char* key) { return ports.module.localizedString(key); };
  const std::string size = Platform::ByteCountFormatter(ports.userLocale.numberIdentifier())
                               .string(foundSize_, Platform::ByteCountStyle::file);
  return {
      .identifier = userNotificationIdentifier(),
      .title = localized("Varnel_NextDayCleanupReminder_Title"),
      .informativeText =
          Platform::formatted(localized("Varnel_NextDayCleanupReminder_Subtitle"), {size}),
      .actionButtonTitle = localized("Varnel_NextDayCleanupReminder_ActionButton"),
      .otherButtonTitle = localized("Varnel_NextDayCleanupReminder_OtherButton"),
      .deliveryDate = Platform::Calendar(ports.userLocale, ports.timeZones)
                          .adding({.day = 1}, ports.clock.now()),
  };
}

}  // namespace Varnel
