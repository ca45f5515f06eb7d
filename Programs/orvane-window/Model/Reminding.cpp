// SPDX-License-Identifier: MIT
#include <orvane-window/Model/Reminding.h>

#include <algorithm>
#include <limits>
#include <utility>

#include <Varnel/Reminders/NextDayCleanupReminderInfo.h>
#include <Varnel/Reminders/SchedulerService.h>
#include <Varnel/Reminders/UserNotificationRouter.h>
#include <Varnel/Tallyhouse/AnalyticsTracker.h>
#include <orvane/Console.h>
#include <orvane/Reminders.h>

namespace Orvane {

using Varnel::SchedulePeriodOption;
using Varnel::SchedulerService;
using Router = Varnel::UserNotificationRouter;

Reminding::Reminding(Router& router, Console& console, Clicked clicked)
    : console_(console),
      service_(std::make_unique<SchedulerService>(std::make_shared<Tallyhouse::AnalyticsTracker>(),
                                                  router)) {
  auto& center = router.userNotificationCenter();
  const auto show = [&center, clicked = std::move(clicked)](
                        const Varnel::Platform::UserNotification& notification,
                        Router::EventKind kind) {
    if (kind == Router::EventKind::didDeliver) return;
    // The service does so for its own; once gone it is none to be removed.
    removeClicked(center, notification);
    clicked(notification.activationToken);
  };
  router.register_("SchedulerNotification", show);
  router.register_(Varnel::NextDayCleanupReminderInfo::userNotificationIdentifier(), show);
  // Who has chosen nothing keeps what is planned.
  if (const auto period = storedPeriod()) service_->setSchedulePeriod(*period);
}

Reminding::~Reminding() = default;

SchedulePeriodOption Reminding::period() const {
  return storedPeriod().value_or(SchedulePeriodOption::never);
}

bool Reminding::setPeriod(SchedulePeriodOption period) {
  if (!storePeriod(period, console_)) return false;
  service_->setSchedulePeriod(period);
  return true;
}

void Reminding::schedule(std::uint64_t bytesLeftToClean) {
  constexpr std::uint64_t max = std::numeric_limits<std::int64_t>::max();
  if (storedPeriod())
    service_->scheduleCleanReminder(static_cast<std::int64_t>(std::min(bytesLeftToClean, max)));
}

}  // namespace Orvane
