// SPDX-License-Identifier: MIT
#pragma once

#include <functional>
#include <memory>
#include <string>

#include <Varnel/Platform/Generic/DelivererConnection.h>
#include <Varnel/Platform/Linux/Adapters.h>
#include <Varnel/Platform/Linux/Notifications/SessionBus.h>

namespace Varnel::Platform::Linux {

/// The way to the session's notifier, which the bus starts when it is needed. Where the bus has no
/// such service or cannot start it, or there is no bus, a deliverer of this process takes its
/// place, and keeps it. What got no answer is said again, after pauses that grow from a second to
/// five minutes.
///
/// A host owns the product's host name on the bus: the first process that asked for it, but an
/// onlooker leaves it to the application. Main thread only.
class NotifierConnection final : public DelivererConnection {
 public:
  /// `store` is the file of the product's notifications. `makeDeliverer` makes the one that takes
  /// the notifier's place. Nobody else observes the bus.
  NotifierConnection(std::shared_ptr<SessionBus> bus, const std::string& baseIdentifier,
                     std::string store, MakeDeliverer makeDeliverer);
  ~NotifierConnection() override;

  void setHost(std::weak_ptr<NotificationHost> host, Standing standing) override;
  void setActive(bool isActive) override;
  void changed() override;
  void changedAtOnce() override;
  void checkBanners(std::function<void(const Failure& obstacle)> answer) override;
  [[nodiscard]] bool isBusy() const override;

 private:
  class Conversation;

  const std::shared_ptr<Conversation> conversation_;
};

}  // namespace Varnel::Platform::Linux
