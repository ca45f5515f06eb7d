// SPDX-License-Identifier: MIT
#pragma once

#include <Tests/Contract/Contract.h>
#include <Varnel/Platform/Ports/MachineIdentity.h>

namespace Varnel::Platform::Contract {

/// A machine that hides who it is.
class MachineIdentityWorld : public World {
 public:
  virtual MachineIdentity& machine() = 0;
  /// 32 hexadecimal digits, and a text; an empty one stands in the place of an identity.
  virtual void identify(const std::string& uuid, const std::string& serial) = 0;
  /// Gives the primary interface this hardware address; empty for none.
  virtual void connect(const PropertyData& address) = 0;
};

using MachineIdentityContract = Suite<MachineIdentityWorld>;

}  // namespace Varnel::Platform::Contract
