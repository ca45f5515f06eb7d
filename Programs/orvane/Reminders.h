// SPDX-License-Identifier: MIT
#pragma once

#include <chrono>
#include <optional>
#include <string>

#include <Varnel/Platform/Ports/UserNotificationCenter.h>
#include <Varnel/Reminders/SchedulePeriodOption.h>

namespace Orvane {

class Console;

/// How much longer a command waits for others: a few seconds from the first call on. Servers answer
/// within milliseconds, unless they have yet to be started, and processes keep the store no longer.
[[nodiscard]] std::chrono::milliseconds patience();

/// The period that the user chose, kept in the product's settings; absent until then, and where the
/// setting cannot be read.
[[nodiscard]] std::optional<Varnel::SchedulePeriodOption> storedPeriod();
/// Returns whether the period is kept, and complains where it is not.
[[nodiscard]] bool storePeriod(Varnel::SchedulePeriodOption period, Console& console);

/// Asks the center for a list and, where it cannot be read, once more after a pause: another
/// process may have kept the store for a moment.
using NotificationList = Varnel::Platform::UserNotificationCenter::Notifications (
    Varnel::Platform::UserNotificationCenter::*)();
[[nodiscard]] Varnel::Platform::UserNotificationCenter::Notifications readPatiently(
    Varnel::Platform::UserNotificationCenter& center, NotificationList list);

/// Writes the stored period and the notifications of a center, a line each. False when they cannot
/// be read or written, which it says.
[[nodiscard]] bool writeStatus(Varnel::Platform::UserNotificationCenter& center, Console& console);

/// Takes a notification that was clicked off the delivered list: now, or when the center can, which
/// the notifier may hinder with a note of the same click. The center outlives that.
void removeClicked(Varnel::Platform::UserNotificationCenter& center,
                   const Varnel::Platform::UserNotification& notification);

/// A notification in a line: its identifier, title and text.
[[nodiscard]] std::string lineOf(const Varnel::Platform::UserNotification& notification);

}  // namespace Orvane
