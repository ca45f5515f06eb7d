// SPDX-License-Identifier: MIT
#pragma once

#include <string>

#include <Varnel/Platform/Values/UserNotification.h>
#include <Varnel/Reminders/SchedulePeriodOption.h>

namespace Varnel::Platform {
class UserNotificationCenter;
}

namespace Orvane {

class Console;

/// The period that the user chose, kept in this program's settings; never until then, and where the
/// setting is damaged.
[[nodiscard]] Varnel::SchedulePeriodOption storedPeriod();
/// Returns whether the period is kept, and complains where it is not.
[[nodiscard]] bool storePeriod(Varnel::SchedulePeriodOption period, Console& console);

/// Lets the desktop show and take away what the center told it to. If that takes more than a few
/// seconds, it complains and does not wait longer.
void awaitDesktop(Varnel::Platform::UserNotificationCenter& center, Console& console);

/// The stored period and the notifications of a center, a line each.
[[nodiscard]] std::string statusText(Varnel::Platform::UserNotificationCenter& center);

/// A notification in a line: its identifier, title and text.
[[nodiscard]] std::string lineOf(const Varnel::Platform::UserNotification& notification);

}  // namespace Orvane
