// SPDX-License-Identifier: MIT
#pragma once

#include <functional>
#include <map>
#include <memory>
#include <string>
#include <utility>

#include <Varnel/Platform/Generic/NotificationHosts.h>
#include <Varnel/Platform/Linux/Notifications/SessionBus.h>

namespace Varnel::Platform::Linux {

/// A product's running processes, as they are found on the session bus. One of them is the host,
/// which owns the product's host name; any of them may be in front. Main thread only.
class BusHosts final : public NotificationHosts {
 public:
  /// `launch` is called for a click when no host runs.
  BusHosts(std::shared_ptr<SessionBus> bus,
           std::function<void(const NotificationActivation&)> launch);

  /// The product's host name, before anything is asked.
  void setName(std::string name) { name_ = std::move(name); }

  void shouldPresent(const UserNotification& notification,
                     std::function<void(bool isToShow)> answer) override;
  void didDeliver(const UserNotification& notification) override;
  void didActivate(const NotificationActivation& activation) override;

  /// Whether the process with this unique name is in front; it is not any more once it has gone.
  void setActive(const std::string& process, bool isActive);

  /// Whether a host has yet to take a click.
  [[nodiscard]] bool isBusy() const { return pendingClicks_ > 0; }

 private:
  [[nodiscard]] bool isInFront() const { return !active_.empty(); }
  [[nodiscard]] BusMessage message(const char* method, GVariant* body) const;

  const std::shared_ptr<SessionBus> bus_;
  std::string name_;
  const std::function<void(const NotificationActivation&)> launch_;
  std::map<std::string, SessionBus::Subscription> active_;  ///< By unique name: who hears its end.
  int pendingClicks_ = 0;
  const std::shared_ptr<BusHosts*> life_ = std::make_shared<BusHosts*>(this);
};

}  // namespace Varnel::Platform::Linux
