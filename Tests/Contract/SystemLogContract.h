// SPDX-License-Identifier: MIT
#pragma once

#include <Tests/Contract/Contract.h>
#include <Varnel/Platform/Ports/SystemLog.h>

namespace Varnel::Platform::Contract {

class SystemLogWorld : public World {
 public:
  virtual SystemLog& log() = 0;
  /// All that the log has been given, each line ended by a line feed.
  virtual std::string text() = 0;
};
using SystemLogContract = Suite<SystemLogWorld>;

}  // namespace Varnel::Platform::Contract
