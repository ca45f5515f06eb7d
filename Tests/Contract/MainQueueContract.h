// SPDX-License-Identifier: MIT
#pragma once

#include <Tests/Contract/Contract.h>
#include <Varnel/Platform/Ports/MainQueue.h>

namespace Varnel::Platform::Contract {

/// A queue whose main thread is that of the test.
class MainQueueWorld : public World {
 public:
  virtual MainQueue& queue() = 0;
};

using MainQueueContract = Suite<MainQueueWorld>;

}  // namespace Varnel::Platform::Contract
