// SPDX-License-Identifier: MIT
#pragma once

#include <functional>

#include <Varnel/Platform/Values/UserNotification.h>

namespace Varnel::Platform {

/// A click of the user on a banner. A plain value.
struct NotificationActivation final {
  /// With the token with which the application may come to the front, if the desktop gave one.
  UserNotification notification;
  bool isActionButton = false;  ///< Otherwise it was the banner itself.
};

/// The running processes of a product, as the deliverer of its notifications sees them.
///
/// Main thread only; no operation waits.
class NotificationHosts {
 public:
  virtual ~NotificationHosts() = default;

  /// Asks whether to show a notification that is being delivered: no where a process of the product
  /// is in front, otherwise what its host says, and yes where there is none. `answer` may be called
  /// on the main thread at any time, also within this call, after the deliverer's end, or never:
  /// the deliverer waits no longer than it wants to.
  virtual void shouldPresent(const UserNotification& notification,
                             std::function<void(bool isToShow)> answer) = 0;

  /// Tells a host of a delivery, shown or not; where there is none, nobody hears of it.
  virtual void didDeliver(const UserNotification& notification) = 0;

  /// Tells a host of a click or, where there is none, starts the application.
  virtual void didActivate(const NotificationActivation& activation) = 0;
};

}  // namespace Varnel::Platform
