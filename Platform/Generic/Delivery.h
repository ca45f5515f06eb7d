// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <optional>
#include <string>

#include <Varnel/Platform/Generic/NotificationSchedule.h>

namespace Varnel::Platform {

/// Where a delivery stands. Only planned ones have a date ahead; the delivered list is due,
/// hidden, toShow, shown and expired.
enum class DeliveryState {
  planned,
  due,      ///< Its date has come; whether to show it has yet to be asked.
  hidden,   ///< Delivered without a banner, for good.
  toShow,   ///< Delivered; its banner has yet to come.
  shown,    ///< Its banner has come.
  expired,  ///< Its banner has gone by itself, with a click, with its server or who showed it.
  removed   ///< It counts no more; its banner has yet to be closed.
};

/// One delivery of a notification. A plain value.
struct Delivery final {
  std::int64_t number = 0;  ///< Names it, for ever.
  DeliveryState state = DeliveryState::planned;
  NotificationSchedule schedule;
  /// The server's reference of its banner, as long as that may be there. Until it is shown, and in
  /// a hidden one: of the banner of its predecessor, which it replaces.
  std::optional<std::string> banner = std::nullopt;
};

}  // namespace Varnel::Platform
