// SPDX-License-Identifier: MIT
#pragma once

#include <Tests/Contract/Contract.h>
#include <Varnel/Platform/Ports/Clock.h>

namespace Varnel::Platform::Contract {

class ClockWorld : public World {
 public:
  virtual Clock& clock() = 0;
  /// Lets some time pass that the clock can tell.
  virtual void pass() = 0;
};

using ClockContract = Suite<ClockWorld>;

}  // namespace Varnel::Platform::Contract
