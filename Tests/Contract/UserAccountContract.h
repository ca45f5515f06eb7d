// SPDX-License-Identifier: MIT
#pragma once

#include <Tests/Contract/Contract.h>
#include <Varnel/Platform/Ports/UserAccount.h>

namespace Varnel::Platform::Contract {

class UserAccountWorld : public World {
 public:
  virtual UserAccount& account() = 0;
  /// Moves the home away from the one on record, as an environment or a sandbox does.
  virtual void moveHome(const std::string& path) = 0;
};

using UserAccountContract = Suite<UserAccountWorld>;

}  // namespace Varnel::Platform::Contract
