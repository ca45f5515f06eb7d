// SPDX-License-Identifier: MIT
#pragma once

#include <memory>
#include <string>

#include <Varnel/Platform/Api.h>
#include <Varnel/Platform/Generic/DelivererConnection.h>
#include <Varnel/Platform/Generic/DelivererPorts.h>

namespace Varnel::Platform {

class NotificationDeliverer;

/// The deliverer of a product's notifications within a process of the product, where no other
/// program does that.
///
/// It delivers while there is a host, and what must not wait for one. Processes of the product
/// learn from a lock on a file beside the store that one of them is in front. Main thread only.
class InProcessDeliverer final : public DelivererConnection {
 public:
  /// The store's folder is made now.
  InProcessDeliverer(const DelivererPorts& ports, const std::string& storeFile);
  ~InProcessDeliverer() override;

  void setHost(std::weak_ptr<NotificationHost> host, Standing standing) override;
  void setActive(bool isActive) override;
  /// To be called as well when another process has changed the store, or the user's time zone has
  /// changed.
  void changed() override;
  void changedAtOnce() override;
  void checkBanners(std::function<void(const Failure& obstacle)> answer) override;
  [[nodiscard]] bool isBusy() const override;

 private:
  class Hosts;

  void recheck();

  const std::shared_ptr<Hosts> hosts_;
  const std::unique_ptr<NotificationDeliverer> deliverer_;
  NotificationServer& server_;
  bool isAskedToDeliver_ = false;
};

}  // namespace Varnel::Platform
