// SPDX-License-Identifier: MIT
#pragma once

#include <functional>
#include <vector>

#include <Tests/Contract/Contract.h>
#include <Varnel/Platform/Ports/NotificationServer.h>

namespace Varnel::Platform::Contract {

/// A desktop whose server runs, and its user. Banners are told by their titles.
class NotificationServerWorld : public World {
 public:
  virtual NotificationServer& server() = 0;
  /// What the user sees.
  [[nodiscard]] virtual std::vector<Banner> banners() = 0;
  virtual void activate(const std::string& title) = 0;
  virtual void dismiss(const std::string& title) = 0;
  virtual void expire(const std::string& title) = 0;
  virtual void endServer() = 0;
  virtual void startServer() = 0;
  /// Lets the server work, and the main thread, until the condition holds.
  virtual void workUntil(const std::function<bool()>& condition) = 0;
};

using NotificationServerContract = Suite<NotificationServerWorld>;

}  // namespace Varnel::Platform::Contract
