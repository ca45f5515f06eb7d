// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <functional>
#include <memory>
#include <optional>

#include <Varnel/Platform/Values/PlatformError.h>
#include <Varnel/Platform/Values/Result.h>
#include <Varnel/Reminders/SchedulePeriodOption.h>

namespace Varnel {
class SchedulerService;
}
namespace Varnel::Platform {
class UserNotificationCenter;
struct UserNotification;
}  // namespace Varnel::Platform

namespace Orvane {

class Console;

/// Whether exactly the reminder of this period is planned.
[[nodiscard]] Varnel::Platform::Result<bool> isPlanned(
    Varnel::Platform::UserNotificationCenter& center, Varnel::SchedulePeriodOption period);

/// Plans anew where the stored period is not the planned one: a program was killed between storing
/// and planning, or could not plan. Says what is in its way, and tries again while the main queue
/// runs; the service and the console outlive that.
void repairPlan(Varnel::SchedulerService& service, Console& console);

/// Plans for a program that ends when it has planned, and is not told of deliveries. Each operation
/// lets the desktop follow, a few seconds at most, and answers whether what it was asked for is
/// found again in the store; where it is not, it complains.
///
///     ReminderPlanner planner(console);
///     if (!planner.planRegular(period)) return 1;
class ReminderPlanner final {
 public:
  explicit ReminderPlanner(Console& console);
  ~ReminderPlanner();
  ReminderPlanner(const ReminderPlanner&) = delete;
  ReminderPlanner& operator=(const ReminderPlanner&) = delete;

  /// The reminder of this period, which is stored; anew also where it is planned already. It names
  /// the bytes that a scan has found to be cleaned, or what the present one names.
  [[nodiscard]] bool planRegular(Varnel::SchedulePeriodOption period,
                                 std::optional<std::int64_t> sizeLeftToClean = std::nullopt);
  /// A notification of its own, beside the reminder of the stored period.
  [[nodiscard]] bool plan(const Varnel::Platform::UserNotification& notification);

  [[nodiscard]] Varnel::Platform::UserNotificationCenter& center() const;

 private:
  using Failure = std::optional<Varnel::Platform::PlatformError>;
  struct Parts;

  void awaitDesktop(const std::function<bool()>& isWaiting) const;

  Console& console_;
  const std::unique_ptr<Parts> parts_;
};

}  // namespace Orvane
