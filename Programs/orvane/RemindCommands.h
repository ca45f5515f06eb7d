// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>

#include <Varnel/Reminders/SchedulePeriodOption.h>

namespace Orvane {

class Console;

/// `orvane remind every`: chooses how often the user is reminded to clean up.
struct RemindEveryCommand {
  Varnel::SchedulePeriodOption period = Varnel::SchedulePeriodOption::never;

  [[nodiscard]] int run(Console& console) const;
};

/// `orvane remind status`: tells the chosen period, whether its reminder is planned, and lists the
/// notifications.
struct RemindStatusCommand {
  [[nodiscard]] int run(Console& console) const;
};

/// `orvane remind tomorrow`: reminds the user a day from now of what a scan has found.
struct RemindTomorrowCommand {
  std::int64_t foundSize = 0;  ///< In bytes, as the next.
  std::int64_t selectedSize = 0;

  [[nodiscard]] int run(Console& console) const;
};

/// `orvane remind listen`: tells what happens to reminders, until it is interrupted. Started by a
/// click on one, it tells that too.
struct RemindListenCommand {
  [[nodiscard]] int run(Console& console) const;
};

}  // namespace Orvane
