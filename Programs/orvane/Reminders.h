// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <string>

#include <Varnel/Platform/Values/UserNotification.h>
#include <Varnel/Reminders/SchedulePeriodOption.h>

namespace Varnel::Platform {
class UserNotificationCenter;
}

namespace Orvane {

class Console;

/// The period that the user chose, kept in the product's settings; absent until then, and where the
/// setting cannot be read.
[[nodiscard]] std::optional<Varnel::SchedulePeriodOption> storedPeriod();
/// Returns whether the period is kept, and complains where it is not.
[[nodiscard]] bool storePeriod(Varnel::SchedulePeriodOption period, Console& console);

/// Writes the stored period and the notifications of a center, a line each. False when they cannot
/// be read or written, which it says.
[[nodiscard]] bool writeStatus(Varnel::Platform::UserNotificationCenter& center, Console& console);

/// A notification in a line: its identifier, title and text.
[[nodiscard]] std::string lineOf(const Varnel::Platform::UserNotification& notification);

}  // namespace Orvane
