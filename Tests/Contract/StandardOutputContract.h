// SPDX-License-Identifier: MIT
#pragma once

#include <Tests/Contract/Contract.h>
#include <Varnel/Platform/Ports/StandardOutput.h>

namespace Varnel::Platform::Contract {

class StandardOutputWorld : public World {
 public:
  virtual StandardOutput& output() = 0;
  /// All that was printed. Nothing is printed after it.
  virtual std::string printed() = 0;
};
using StandardOutputContract = Suite<StandardOutputWorld>;

}  // namespace Varnel::Platform::Contract
