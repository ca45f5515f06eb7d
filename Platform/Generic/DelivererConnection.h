// SPDX-License-Identifier: MIT
#pragma once

#include <functional>
#include <memory>

#include <Varnel/Platform/Api.h>
#include <Varnel/Platform/Generic/NotificationHosts.h>
#include <Varnel/Platform/Ports/UserNotificationCenter.h>

namespace Varnel::Platform {

/// The application, as the deliverer's end of a connection calls it. Called on the main thread, and
/// never within a call of the connection, but for `shouldPresent`.
class VARNEL_API NotificationHost {
 public:
  virtual ~NotificationHost() = default;

  [[nodiscard]] virtual bool shouldPresent(const UserNotification& notification) = 0;
  virtual void didDeliver(const UserNotification& notification) = 0;
  virtual void didActivate(const NotificationActivation& activation) = 0;
};

/// The way from a product's notification center to the one that delivers what the center has put
/// into the store: an object of this process (`InProcessDeliverer`), or another process.
///
///     connection.setHost(host, Standing::application);
///     …                        // the store is changed
///     connection.changed();
///
/// Main thread only; no operation waits or fails: what cannot be done now is done later.
class VARNEL_API DelivererConnection {
 public:
  using Failure = UserNotificationCenter::Failure;
  using Standing = UserNotificationCenter::Standing;

  virtual ~DelivererConnection() = default;

  /// The only host of this process from now on; an expired one is none.
  virtual void setHost(std::weak_ptr<NotificationHost> host, Standing standing) = 0;
  /// Whether this process is in front. It is not until this says so.
  virtual void setActive(bool isActive) = 0;

  /// To be called after each change of the store.
  virtual void changed() = 0;
  /// The same, where the change has made something due that must not wait for a host.
  virtual void changedAtOnce() = 0;

  /// See `UserNotificationCenter::checkBanners` and `isBusy`.
  virtual void checkBanners(std::function<void(const Failure& obstacle)> answer) = 0;
  [[nodiscard]] virtual bool isBusy() const = 0;
};

}  // namespace Varnel::Platform
