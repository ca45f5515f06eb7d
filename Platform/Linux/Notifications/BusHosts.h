// SPDX-License-Identifier: MIT
#pragma once

#include <functional>
#include <memory>
#include <string>

#include <Varnel/Platform/Generic/NotificationHosts.h>
#include <Varnel/Platform/Linux/Notifications/SessionBus.h>

namespace Varnel::Platform::Linux {

/// A product's running processes, as they are found on the session bus. One of them is the host,
/// which owns the product's host name; any of them may be in front, and owns another name then. The
/// bus knows that also after this program was started anew. Main thread only.
class BusHosts final : public NotificationHosts {
 public:
  /// `launch` is called for a click when no host runs.
  BusHosts(std::shared_ptr<SessionBus> bus,
           std::function<void(const NotificationActivation&)> launch);

  /// Whose processes they are, before anything is asked.
  void setProduct(const std::string& baseIdentifier);

  void shouldPresent(const UserNotification& notification,
                     std::function<void(bool isToShow)> answer) override;
  void didDeliver(const UserNotification& notification) override;
  void didActivate(const NotificationActivation& activation) override;

  /// Whether a host has yet to take a click.
  [[nodiscard]] bool isBusy() const { return pendingClicks_ > 0; }

 private:
  void askHost(const UserNotification& notification,
               const std::function<void(bool isToShow)>& answer);
  [[nodiscard]] BusMessage message(const char* method, GVariant* body) const;

  const std::shared_ptr<SessionBus> bus_;
  std::string hostName_;
  std::string frontName_;
  const std::function<void(const NotificationActivation&)> launch_;
  int pendingClicks_ = 0;
  const std::shared_ptr<BusHosts*> life_ = std::make_shared<BusHosts*>(this);
};

}  // namespace Varnel::Platform::Linux
