// SPDX-License-Identifier: MIT
#pragma once

#include <Varnel/Platform/SQLite/SQLiteStatement.h>
#include <Varnel/Platform/Values/UserNotification.h>

namespace Varnel::Platform {

/// How many columns hold the content of a notification, whatever the table.
inline constexpr int notificationColumnCount = 12;

/// Their names, for statements: from the identifier to the seconds of the interval.
inline constexpr const char* notificationColumns =
    "identifier, title, text, action, other, date, years, months, days, hours, minutes, seconds";

/// Binds the content to the parameters from `first` on.
void bindNotification(SQLiteStatement& statement, int first, const UserNotification& notification);

/// The content in the columns from `first` on. Any content gives a notification.
[[nodiscard]] UserNotification readNotification(SQLiteStatement& row, int first);

}  // namespace Varnel::Platform
