// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <functional>
#include <memory>
#include <optional>
#include <string>

#include <Varnel/Reminders/SchedulePeriodOption.h>

namespace Varnel {
class SchedulerService;
class UserNotificationRouter;
}  // namespace Varnel

namespace Orvane {

class Console;

/// The reminder to clean up, in step with the period that the user has chosen, and what its click
/// asks for. To be made at the application's start-up, in the one process that stays. Main thread.
class Reminding final {
 public:
  /// The click's token brings a window to the front; none where the desktop gave none.
  using Clicked = std::function<void(const std::optional<std::string>& activationToken)>;

  /// The router and the console outlive this.
  Reminding(Varnel::UserNotificationRouter& router, Console& console, Clicked clicked);
  ~Reminding();
  Reminding(const Reminding&) = delete;
  Reminding& operator=(const Reminding&) = delete;

  /// What the user has chosen; never, where nothing was chosen.
  [[nodiscard]] Varnel::SchedulePeriodOption period() const;
  /// False when the choice could not be kept.
  [[nodiscard]] bool setPeriod(Varnel::SchedulePeriodOption period);

  /// To be called after a scan and a removal.
  void schedule(std::uint64_t bytesLeftToClean);

 private:
  Console& console_;
  const std::unique_ptr<Varnel::SchedulerService> service_;
};

}  // namespace Orvane
