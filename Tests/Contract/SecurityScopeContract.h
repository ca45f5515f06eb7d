// SPDX-License-Identifier: MIT
#pragma once

#include <Tests/Contract/Contract.h>
#include <Varnel/Platform/Ports/SecurityScope.h>

namespace Varnel::Platform::Contract {

class SecurityScopeWorld : public World {
 public:
  virtual SecurityScope& scope() = 0;
  /// A file, or a folder, that the process may read, and one that it may not.
  virtual URL readable(bool isFolder) = 0;
  virtual URL forbidden() = 0;
};
using SecurityScopeContract = Suite<SecurityScopeWorld>;

}  // namespace Varnel::Platform::Contract
