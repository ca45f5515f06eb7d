// SPDX-License-Identifier: MIT
#pragma once

#include <functional>

#include <Tests/Contract/Contract.h>
#include <Varnel/Platform/Ports/WallClockTimer.h>

namespace Varnel::Platform::Contract {

class WallClockTimerWorld : public World {
 public:
  /// A timer on the clock that `now` tells. All have the same main thread, that of the test.
  virtual std::unique_ptr<WallClockTimer> timer() = 0;
  virtual Date now() = 0;
  /// Lets time pass, on the main thread, until the condition holds.
  virtual void passUntil(const std::function<bool()>& condition) = 0;
};

using WallClockTimerContract = Suite<WallClockTimerWorld>;

}  // namespace Varnel::Platform::Contract
