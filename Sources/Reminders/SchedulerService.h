// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <functional>
#include <memory>
#include <optional>
#include <string>

#include <Varnel/Basalt/ExecutionContext.h>
#include <Varnel/Platform/Api.h>
#include <Varnel/Platform/Values/Date.h>
#include <Varnel/Platform/Values/DateComponents.h>
#include <Varnel/Platform/Values/PlatformError.h>
#include <Varnel/Platform/Values/Result.h>
#include <Varnel/Reminders/SchedulePeriodOption.h>
#include <Varnel/Reminders/SchedulerAnalyticsSender.h>

namespace Tallyhouse {
class AnalyticsTracker;
}

namespace Varnel::Platform {
class Clock;
class MainQueue;
class TimeZones;
class UserLocale;
class UserNotificationCenter;
struct Ports;
}  // namespace Varnel::Platform

namespace Varnel {

class BaseModule;
class ProcessFacts;
class UserNotificationRouter;

/// Keeps one repeating reminder to clean up in the notification center, in step with the period
/// that the user chose.
///
///     SchedulerService service(tracker, router);
///     service.setSchedulePeriod(SchedulePeriodOption::monthly);  // when the user chooses it
///     service.scheduleCleanReminder(bytesLeft);                  // after a scan
///
/// A reminder comes one full period after it was scheduled, and again after each. When the user
/// clicks it, the service reports that and takes the banner away. The host keeps the period: a new
/// service has `never`, and changes nothing until it is called.
///
/// Every repeating notification of the application counts as this service's and is swept away with
/// its reminder: the host schedules none.
///
/// Sweeping and scheduling are one change, which is made wholly or not at all. Where it cannot be
/// made (a full disk, say), `failure` tells why, and the service tries again for as long as it
/// lives; what is asked of it meanwhile takes the place of that. Main thread only.
class VARNEL_API SchedulerService final : public Basalt::ExecutionContext {
 public:
  struct Ports {
    Platform::Clock& clock;
    Platform::UserLocale& userLocale;
    Platform::TimeZones& timeZones;
    Platform::MainQueue& mainQueue;
    const ProcessFacts& facts;                 ///< For the application's name.
    std::shared_ptr<const BaseModule> module;  ///< For the texts.
  };

  /// The router must outlive the service.
  SchedulerService(Ports ports, std::shared_ptr<Tallyhouse::AnalyticsTracker> analyticsTracker,
                   UserNotificationRouter& userNotificationRouter);
  SchedulerService(const Platform::Ports& ports,
                   std::shared_ptr<Tallyhouse::AnalyticsTracker> analyticsTracker,
                   UserNotificationRouter& userNotificationRouter);
  SchedulerService(std::shared_ptr<Tallyhouse::AnalyticsTracker> analyticsTracker,
                   UserNotificationRouter& userNotificationRouter);

  [[nodiscard]] SchedulePeriodOption schedulePeriod() const { return schedulePeriod_; }
  /// Plans the reminder anew, also for the same period again; with `never`, removes it.
  void setSchedulePeriod(SchedulePeriodOption period);

  /// Schedules the reminder without a size.
  void scheduleCleanReminder();
  /// Schedules it for a number of bytes, which it names from 2,000,000,000 on.
  void scheduleCleanReminder(std::int64_t sizeLeftToClean);
  /// Plans the reminder anew with the texts of the present one; without one, a reminder without a
  /// size.
  void rescheduleExistingReminder();

  [[nodiscard]] Platform::UserNotificationCenter& userNotificationCenter() const;

  /// What has kept the last plan from being made; none once it is made.
  [[nodiscard]] const std::optional<Platform::PlatformError>& failure() const { return failure_; }

 private:
  using Failure = std::optional<Platform::PlatformError>;

  struct Texts {
    std::string title;
    std::string subtitle;
  };
  /// What the center is to hold, as of the moment when it was asked for.
  struct Wish {
    Platform::Date moment;
    std::optional<Texts> texts;  ///< Those of the present reminder when absent.
  };

  [[nodiscard]] std::string localized(const char* key) const;
  [[nodiscard]] std::string simpleAlertTile() const;
  [[nodiscard]] std::string simpleAlertSubtitle() const;
  [[nodiscard]] Texts simpleTexts() const { return {simpleAlertTile(), simpleAlertSubtitle()}; }
  void plan(std::optional<Texts> texts);
  void fulfil();
  void removeClicked(const Platform::UserNotification& notification);
  void retryLater(std::function<void()> retry);
  [[nodiscard]] Failure fulfil(const Wish& wish);
  [[nodiscard]] Platform::Result<Texts> existingTexts();
  [[nodiscard]] Failure scheduleNotification(const Texts& texts, Platform::Date moment);
  [[nodiscard]] Failure removePreviouslyScheduledNotifications();
  [[nodiscard]] Platform::Date calculateDeliveryDate(const Platform::DateComponents& repeatInterval,
                                                     Platform::Date moment) const;

  const Ports ports_;
  SchedulePeriodOption schedulePeriod_ = SchedulePeriodOption::never;
  SchedulerAnalyticsSender analyticsSender_;
  UserNotificationRouter& userNotificationRouter_;
  std::optional<Wish> wish_;  ///< Until it is fulfilled.
  bool isRetrying_ = false;
  Failure failure_;
};

}  // namespace Varnel
