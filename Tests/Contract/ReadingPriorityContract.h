// SPDX-License-Identifier: MIT
#pragma once

#include <Tests/Contract/Contract.h>
#include <Varnel/Platform/Ports/ReadingPriority.h>

namespace Varnel::Platform::Contract {

class ReadingPriorityWorld : public World {
 public:
  virtual ReadingPriority& priority() = 0;
};
using ReadingPriorityContract = Suite<ReadingPriorityWorld>;

}  // namespace Varnel::Platform::Contract
