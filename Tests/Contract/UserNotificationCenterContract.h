// SPDX-License-Identifier: MIT
#pragma once

#include <chrono>
#include <string>
#include <vector>

#include <Tests/Contract/Contract.h>
#include <Varnel/Platform/Ports/UserNotificationCenter.h>

namespace Varnel::Platform::Contract {

/// A user with a desktop that shows every banner, and never looks at any but as the test says.
class UserNotificationCenterWorld : public World {
 public:
  virtual UserNotificationCenter& center() = 0;
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
