// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <string>

#include <Varnel/Platform/Api.h>
#include <Varnel/Platform/Values/UserNotification.h>

namespace Varnel::Platform {
class Clock;
class TimeZones;
class UserLocale;
struct Ports;
}  // namespace Varnel::Platform

namespace Varnel {

class BaseModule;

/// The duplicates that a scan found and the user left, for a reminder on the next day.
///
///     const NextDayCleanupReminderInfo info(selected, found);
///     router.userNotificationCenter().scheduleNotification(info.makeUserNotification());
///
/// The host schedules the notification and withdraws an earlier one. An immutable value; any
/// thread.
class VARNEL_API NextDayCleanupReminderInfo final {
 public:
  /// The services that make the notification: by default the process's own.
  struct Ports {
    Platform::Clock& clock;
    Platform::UserLocale& userLocale;
    Platform::TimeZones& timeZones;
    const BaseModule& module;
  };

  /// Sizes in bytes.
  NextDayCleanupReminderInfo(std::int64_t selectedSize, std::int64_t foundSize)
      : selectedSize_(selectedSize), foundSize_(foundSize) {}

  /// "com.quennel.Orvane2.daily-cleanup-reminder".
  [[nodiscard]] static const std::string& userNotificationIdentifier();

  [[nodiscard]] std::int64_t selectedSize() const { return selectedSize_; }
  [[nodiscard]] std::int64_t foundSize() const { return foundSize_; }

  /// A notification, due one day from now at the same time of day, that names what was found.
  [[nodiscard]] Platform::UserNotification makeUserNotification() const;
  [[nodiscard]] Platform::UserNotification makeUserNotification(Ports ports) const;
  [[nodiscard]] Platform::UserNotification makeUserNotification(const Platform::Ports& ports) const;

  bool operator==(const NextDayCleanupReminderInfo&) const = default;

 private:
  std::int64_t selectedSize_;
  std::int64_t foundSize_;
};

/// The name under which the interface layer knows the class.
using OVNextDayCleanupReminderInfo = NextDayCleanupReminderInfo;

}  // namespace Varnel
