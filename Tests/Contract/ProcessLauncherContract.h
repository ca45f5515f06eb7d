// SPDX-License-Identifier: MIT
#pragma once

#include <Tests/Contract/Contract.h>
#include <Varnel/Platform/Ports/ProcessLauncher.h>

namespace Varnel::Platform::Contract {

/// A machine with a few programs.
class ProcessLauncherWorld : public World {
 public:
  struct Program {
    std::string path;
    std::vector<std::string> arguments;
  };

  virtual ProcessLauncher& launcher() = 0;
  virtual Program thatPrints(const std::string& text) = 0;
  /// Ends only when somebody ends it.
  virtual Program thatWaits() = 0;
  virtual Program thatDoesNotExist() = 0;
};
using ProcessLauncherContract = Suite<ProcessLauncherWorld>;

}  // namespace Varnel::Platform::Contract
