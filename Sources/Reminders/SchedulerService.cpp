// SPDX-License-Identifier: MIT
#include <Varnel/Reminders/SchedulerService.h>

#include <utility>
#include <vector>

#include <Varnel/Basalt/MainQueueExecutor.h>
#include <Varnel/Context/Globals.h>
#include <Varnel/Context/ProcessFacts.h>
#include <Varnel/Modules/BaseModule.h>
#include <Varnel/Modules/VarnelModule.h>
#include <Varnel/Platform/Ports/Clock.h>
#include <Varnel/Platform/Ports/Ports.h>
#include <Varnel/Platform/Ports/TimeZones.h>
#include <Varnel/Platform/Ports/UserLocale.h>
#include <Varnel/Platform/Ports/UserNotificationCenter.h>
#include <Varnel/Platform/Text/ByteCountFormatter.h>
#include <Varnel/Platform/Text/Calendar.h>
#include <Varnel/Platform/Text/TextFormat.h>
#include <Varnel/Reminders/UserNotificationRouter.h>

namespace Varnel {
namespace {

using Platform::UserNotification;
using EventKind = UserNotificationRouter::EventKind;

constexpr const char* notificationIdentifier = "SchedulerNotification";
constexpr std::int64_t smallestNamedSize = 2'000'000'000;

// The date that stands for one too far away to be computed.
constexpr Platform::Date distantFuture =
    std::chrono::sys_days(std::chrono::year(4001) / std::chrono::January / 1);

std::vector<UserNotification> repeating(std::vector<UserNotification> notifications) {
  std::erase_if(notifications, [](const auto& each) { return !each.deliveryRepeatInterval; });
  return notifications;
}

SchedulerService::Ports portsOfProcess() {
  const Platform::Ports& ports = Platform::processPorts();
  return {ports.clock,     ports.userLocale, ports.timeZones,
          ports.mainQueue, Globals::facts(), VarnelModule::instance()};
}

}  // namespace

SchedulerService::SchedulerService(Ports ports,
                                   std::shared_ptr<Tallyhouse::AnalyticsTracker> analyticsTracker,
                                   UserNotificationRouter& userNotificationRouter)
    : ExecutionContext(std::make_shared<Basalt::MainQueueExecutor>(ports.mainQueue)),
      ports_(std::move(ports)),
      analyticsSender_({ports_.clock, ports_.userLocale, ports_.timeZones},
                       std::move(analyticsTracker)),
      userNotificationRouter_(userNotificationRouter) {
  userNotificationRouter.channel(notificationIdentifier)
      .onUpdate(*this, [this](const UserNotificationRouter::Event& event) {
        if (event.kind == EventKind::didDeliver) return;
        analyticsSender_.trackNotification(event.notification);
        userNotificationCenter().removeDeliveredNotification(event.notification);
      });
}

SchedulerService::SchedulerService(std::shared_ptr<Tallyhouse::AnalyticsTracker> analyticsTracker,
                                   UserNotificationRouter& userNotificationRouter)
    : SchedulerService(portsOfProcess(), std::move(analyticsTracker), userNotificationRouter) {}

Platform::UserNotificationCenter& SchedulerService::userNotificationCenter() const {
  return userNotificationRouter_.userNotificationCenter();
}

void SchedulerService::setSchedulePeriod(SchedulePeriodOption period) {
  schedulePeriod_ = period;
  if (period == SchedulePeriodOption::never)
    removePreviouslyScheduledNotifications();
  else
    rescheduleExistingReminder();
}

void SchedulerService::scheduleCleanReminder() {
  scheduleNotification(simpleAlertTile(), simpleAlertSubtitle());
}

void SchedulerService::scheduleCleanReminder(std::int64_t sizeLeftToClean) {
  if (sizeLeftToClean < smallestNamedSize) return scheduleCleanReminder();
  const std::string size = Platform::ByteCountFormatter(ports_.userLocale.numberIdentifier())
                               .string(sizeLeftToClean, Platform::ByteCountStyle::file);
  scheduleNotification(
      localized("Varnel_CleanReminder_Title_WithSize_Format"),
      Platform::formatted(localized("Varnel_CleanReminder_Subtitle_WithSize_Format"), {size}));
}

void SchedulerService::rescheduleExistingReminder() {
  const auto existing = repeating(userNotificationCenter().scheduledNotifications());
  if (existing.empty()) return scheduleCleanReminder();
  const UserNotification& first = existing.front();
  scheduleNotification(first.title ? *first.title : simpleAlertTile(),
                       first.informativeText ? *first.informativeText : simpleAlertSubtitle());
}

std::string SchedulerService::localized(const char* key) const {
  return ports_.module->localizedString(key);
}

std::string SchedulerService::simpleAlertTile() const {
  return localized("Varnel_CleanReminder_Title_Simple");
}

std::string SchedulerService::simpleAlertSubtitle() const {
  return localized("Varnel_CleanReminder_Subtitle_Simple");
}

void SchedulerService::scheduleNotification(const std::string& title, const std::string& subtitle) {
  removePreviouslyScheduledNotifications();
  if (schedulePeriod_ == SchedulePeriodOption::never) return;
  const auto interval =
      schedulePeriod_.repeatInterval(Platform::Calendar(ports_.userLocale, ports_.timeZones));
  userNotificationCenter().scheduleNotification({
      .identifier = notificationIdentifier,
      .title = ports_.facts.substitutingApplicationName(title),
      .informativeText = ports_.facts.substitutingApplicationName(subtitle),
      .actionButtonTitle = localized("Varnel_CleanReminder_ActionButton"),
      .otherButtonTitle = localized("Varnel_CleanReminder_OtherButton"),
      .deliveryDate = calculateDeliveryDate(interval),
      .deliveryRepeatInterval = interval,
  });
}

void SchedulerService::removePreviouslyScheduledNotifications() {
  Platform::UserNotificationCenter& center = userNotificationCenter();
  for (const UserNotification& notification : repeating(center.scheduledNotifications()))
    center.removeScheduledNotification(notification);
  for (const UserNotification& notification : repeating(center.deliveredNotifications()))
    center.removeDeliveredNotification(notification);
}

Platform::Date SchedulerService::calculateDeliveryDate(
    const Platform::DateComponents& repeatInterval) const {
  return Platform::Calendar(ports_.userLocale, ports_.timeZones)
      .adding(repeatInterval, ports_.clock.now())
      .value_or(distantFuture);
}

}  // namespace Varnel
