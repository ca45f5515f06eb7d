// SPDX-License-Identifier: MIT
#pragma once

#include <Tests/Contract/Contract.h>
#include <Varnel/Platform/Ports/ProcessInfo.h>

namespace Varnel::Platform::Contract {

class ProcessInfoWorld : public World {
 public:
  virtual ProcessInfo& process() = 0;
  virtual void setEnvironment(const std::string& name, const std::string& value) = 0;
};
using ProcessInfoContract = Suite<ProcessInfoWorld>;

}  // namespace Varnel::Platform::Contract
