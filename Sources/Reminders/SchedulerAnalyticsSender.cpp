// SPDX-License-Identifier: MIT
#include <Varnel/Reminders/SchedulerAnalyticsSender.h>

#include <utility>

#include <Varnel/Platform/Ports/Clock.h>
#include <Varnel/Platform/Ports/Ports.h>
#include <Varnel/Platform/Ports/TimeZones.h>
#include <Varnel/Platform/Ports/UserLocale.h>
#include <Varnel/Platform/Text/DateFormatter.h>

namespace Varnel {

SchedulerAnalyticsSender::SchedulerAnalyticsSender(
    Ports ports, std::shared_ptr<Tallyhouse::AnalyticsTracker> tracker)
    : CommonAnalyticsSender(std::move(tracker)), ports_(ports) {}

SchedulerAnalyticsSender::SchedulerAnalyticsSender(
    const Platform::Ports& ports, std::shared_ptr<Tallyhouse::AnalyticsTracker> tracker)
    : SchedulerAnalyticsSender(Ports{ports.clock, ports.userLocale, ports.timeZones},
                               std::move(tracker)) {}

SchedulerAnalyticsSender::SchedulerAnalyticsSender(
    std::shared_ptr<Tallyhouse::AnalyticsTracker> tracker)
    : SchedulerAnalyticsSender(Platform::processPorts(), std::move(tracker)) {}

void SchedulerAnalyticsSender::trackNotification(const Platform::UserNotification&) {
  const Platform::DateFormatter formatter("HH:mm", ports_.userLocale.identifier(),
                                          ports_.timeZones);
  trackEvent("Notification Clicked", formatter.string(ports_.clock.now()), std::nullopt, {}, {});
}

}  // namespace Varnel
