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
using Notifications = Platform::UserNotificationCenter::Notifications;
using EventKind = UserNotificationRouter::EventKind;

constexpr const char* notificationIdentifier = "SchedulerNotification";
constexpr std::int64_t smallestNamedSize = 2'000'000'000;

// The date that stands for one too far away to be computed.
constexpr Platform::Date distantFuture =
    std::chrono::sys_days(std::chrono::year(4001) / std::chrono::January / 1);

Notifications repeating(Notifications notifications) {
  if (notifications)
    std::erase_if(*notifications, [](const auto& each) { return !each.deliveryRepeatInterval; });
  return notifications;
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
        removeClicked(event.notification);
      });
}

SchedulerService::SchedulerService(const Platform::Ports& ports,
                                   std::shared_ptr<Tallyhouse::AnalyticsTracker> analyticsTracker,
                                   UserNotificationRouter& userNotificationRouter)
    : SchedulerService(Ports{ports.clock, ports.userLocale, ports.timeZones, ports.mainQueue,
                             Globals::facts(), VarnelModule::instance()},
                       std::move(analyticsTracker), userNotificationRouter) {}

SchedulerService::SchedulerService(std::shared_ptr<Tallyhouse::AnalyticsTracker> analyticsTracker,
                                   UserNotificationRouter& userNotificationRouter)
    : SchedulerService(Platform::processPorts(), std::move(analyticsTracker),
                       userNotificationRouter) {}

Platform::UserNotificationCenter& SchedulerService::userNotificationCenter() const {
  return userNotificationRouter_.userNotificationCenter();
}

void SchedulerService::setSchedulePeriod(SchedulePeriodOption period) {
  schedulePeriod_ = period;
  rescheduleExistingReminder();
}

void SchedulerService::scheduleCleanReminder() {
  plan(simpleTexts());
}

void SchedulerService::scheduleCleanReminder(std::int64_t sizeLeftToClean) {
  if (sizeLeftToClean < smallestNamedSize) return scheduleCleanReminder();
  const std::string size = Platform::ByteCountFormatter(ports_.userLocale.numberIdentifier())
                               .string(sizeLeftToClean, Platform::ByteCountStyle::file);
  plan(Texts{
      localized("Varnel_CleanReminder_Title_WithSize_Format"),
      Platform::formatted(localized("Varnel_CleanReminder_Subtitle_WithSize_Format"), {size})});
}

void SchedulerService::rescheduleExistingReminder() {
  // The texts of a plan that could not be made yet are those of the present reminder.
  plan(wish_ ? wish_->texts : std::nullopt);
}

void SchedulerService::plan(std::optional<Texts> texts) {
  if (schedulePeriod_ == SchedulePeriodOption::never) texts.reset();
  wish_ = Wish{.moment = ports_.clock.now(), .texts = std::move(texts)};
  fulfil();
}

void SchedulerService::fulfil() {
  failure_ = userNotificationCenter().change([this] { return fulfil(*wish_); });
  if (!failure_) return wish_.reset();
  if (std::exchange(isRetrying_, true)) return;
  retryLater([this] {
    isRetrying_ = false;
    if (wish_) fulfil();
  });
}

void SchedulerService::removeClicked(const UserNotification& notification) {
  if (userNotificationCenter().removeDeliveredNotification(notification))
    retryLater([this, notification] { removeClicked(notification); });
}

void SchedulerService::retryLater(std::function<void()> retry) {
  userNotificationCenter().retryLater([life = lifetime(), retry = std::move(retry)] {
    if (!life.expired()) retry();
  });
}

SchedulerService::Failure SchedulerService::fulfil(const Wish& wish) {
  if (schedulePeriod_ == SchedulePeriodOption::never)
    return removePreviouslyScheduledNotifications();
  if (wish.texts) return scheduleNotification(*wish.texts, wish.moment);
  const auto texts = existingTexts();
  return texts ? scheduleNotification(*texts, wish.moment) : texts.error();
}

Platform::Result<SchedulerService::Texts> SchedulerService::existingTexts() {
  const auto existing = repeating(userNotificationCenter().scheduledNotifications());
  if (!existing) return existing.error();
  if (existing->empty()) return simpleTexts();
  const UserNotification& first = existing->front();
  return Texts{first.title ? *first.title : simpleAlertTile(),
               first.informativeText ? *first.informativeText : simpleAlertSubtitle()};
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

SchedulerService::Failure SchedulerService::scheduleNotification(const Texts& texts,
                                                                 Platform::Date moment) {
  if (auto error = removePreviouslyScheduledNotifications()) return error;
  const auto interval =
      schedulePeriod_.repeatInterval(Platform::Calendar(ports_.userLocale, ports_.timeZones));
  return userNotificationCenter().scheduleNotification({
      .identifier = notificationIdentifier,
      .title = ports_.facts.substitutingApplicationName(texts.title),
      .informativeText = ports_.facts.substitutingApplicationName(texts.subtitle),
      .actionButtonTitle = localized("Varnel_CleanReminder_ActionButton"),
      .otherButtonTitle = localized("Varnel_CleanReminder_OtherButton"),
      .deliveryDate = calculateDeliveryDate(interval, moment),
      .deliveryRepeatInterval = interval,
  });
}

SchedulerService::Failure SchedulerService::removePreviouslyScheduledNotifications() {
  Platform::UserNotificationCenter& center = userNotificationCenter();
  const auto scheduled = repeating(center.scheduledNotifications());
  if (!scheduled) return scheduled.error();
  for (const UserNotification& notification : *scheduled)
    if (auto error = center.removeScheduledNotification(notification)) return error;
  const auto delivered = repeating(center.deliveredNotifications());
  if (!delivered) return delivered.error();
  for (const UserNotification& notification : *delivered)
    if (auto error = center.removeDeliveredNotification(notification)) return error;
  return std::nullopt;
}

Platform::Date SchedulerService::calculateDeliveryDate(
    const Platform::DateComponents& repeatInterval, Platform::Date moment) const {
  return Platform::Calendar(ports_.userLocale, ports_.timeZones)
      .adding(repeatInterval, moment)
      .value_or(distantFuture);
}

}  // namespace Varnel
