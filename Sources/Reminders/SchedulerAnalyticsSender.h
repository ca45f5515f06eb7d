// SPDX-License-Identifier: MIT
#pragma once

#include <memory>
#include <string>

#include <Varnel/Identification/Analytics/CommonAnalyticsSender.h>
#include <Varnel/Platform/Api.h>

namespace Varnel::Platform {
class Clock;
class TimeZones;
class UserLocale;
struct Ports;
struct UserNotification;
}  // namespace Varnel::Platform

namespace Varnel {

/// Reports what users do with reminders, in the category "Scheduler".
///
///     SchedulerAnalyticsSender(tracker).trackNotification(notification);
///
/// Any thread.
class VARNEL_API SchedulerAnalyticsSender final : public CommonAnalyticsSender {
 public:
  struct Ports {
    Platform::Clock& clock;
    Platform::UserLocale& userLocale;
    Platform::TimeZones& timeZones;
  };

  SchedulerAnalyticsSender(Ports ports, std::shared_ptr<Tallyhouse::AnalyticsTracker> tracker);
  SchedulerAnalyticsSender(const Platform::Ports& ports,
                           std::shared_ptr<Tallyhouse::AnalyticsTracker> tracker);
  explicit SchedulerAnalyticsSender(std::shared_ptr<Tallyhouse::AnalyticsTracker> tracker);

  [[nodiscard]] std::string contextName() const override { return "Scheduler"; }
  [[nodiscard]] std::string categoryName() const override { return contextName(); }

  /// Reports that a notification was clicked, and at what time of day; not which one.
  void trackNotification(const Platform::UserNotification& notification);

 private:
  const Ports ports_;
};

}  // namespace Varnel
