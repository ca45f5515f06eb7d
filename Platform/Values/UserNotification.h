// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <string>

#include <Varnel/Platform/Values/Date.h>
#include <Varnel/Platform/Values/DateComponents.h>

namespace Varnel::Platform {

/// A message to the user, shown by a center now or at some date.
///
///     UserNotification tomorrow{.identifier = "com.example.daily", .title = "Good morning"};
///     tomorrow.deliveryDate = calendar.adding({.day = 1}, clock.now());
///     center.scheduleNotification(tomorrow);
///
/// Texts are plain and UTF-8; a button without a title is not shown. A plain value.
struct UserNotification final {
  /// Tells the notification from others: a center holds one scheduled and one delivered with the
  /// same identifier. Notifications without one are the same if all is equal that the application
  /// has set.
  std::optional<std::string> identifier = std::nullopt;
  std::optional<std::string> title = std::nullopt;
  std::optional<std::string> informativeText = std::nullopt;
  std::optional<std::string> actionButtonTitle = std::nullopt;
  std::optional<std::string> otherButtonTitle = std::nullopt;

  /// When to deliver it; at once when absent or past. For a scheduled notification that repeats, it
  /// is the next date.
  std::optional<Date> deliveryDate = std::nullopt;
  /// How often to deliver it again. Must be positive; otherwise the notification does not repeat.
  std::optional<DateComponents> deliveryRepeatInterval = std::nullopt;
  /// When it was delivered; set by the center.
  std::optional<Date> actualDeliveryDate = std::nullopt;
  /// With which a window of the application may come to the front; set by the center where the user
  /// has clicked the notification and the desktop gave one.
  std::optional<std::string> activationToken = std::nullopt;

  bool operator==(const UserNotification&) const = default;
};

/// Whether the two stand for the same notification of a center.
[[nodiscard]] inline bool isSameNotification(UserNotification left, const UserNotification& right) {
  if (left.identifier || right.identifier) return left.identifier == right.identifier;
  left.actualDeliveryDate = right.actualDeliveryDate;
  left.activationToken = right.activationToken;
  return left == right;
}

}  // namespace Varnel::Platform
