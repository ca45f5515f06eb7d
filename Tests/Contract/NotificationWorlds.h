// SPDX-License-Identifier: MIT
#pragma once

#include <chrono>
#include <functional>
#include <string>
#include <vector>

#include <Tests/Contract/Contract.h>
#include <Varnel/Platform/Ports/NotificationServer.h>
#include <Varnel/Platform/Ports/UserNotificationCenter.h>

namespace Varnel::Platform::Contract {

/// A desktop whose server runs, and its user. Banners are told by their titles.
class NotificationServerWorld : public WorldOf<NotificationServer> {
 public:
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

/// A user with a desktop that shows every banner, and never looks at any but as the test says.
class UserNotificationCenterWorld : public WorldOf<UserNotificationCenter> {
 public:
  [[nodiscard]] virtual Date now() = 0;
  /// Time passes, and what is under way happens.
  virtual void pass(std::chrono::seconds time) = 0;
  /// The titles of all banners that were ever shown.
  virtual std::vector<std::string> banners() = 0;
  virtual void click(const UserNotification& notification) = 0;
  /// The user clicks while the application does not run, and it is started.
  virtual void startBy(const UserNotification& notification) = 0;
};
using UserNotificationCenterContract = Suite<UserNotificationCenterWorld>;

}  // namespace Varnel::Platform::Contract
