// SPDX-License-Identifier: MIT
#pragma once

#include <Tests/Contract/Contract.h>
#include <Varnel/Platform/Ports/ApplicationStorage.h>
#include <Varnel/Platform/Ports/UserDefaults.h>

namespace Varnel::Platform::Contract {

/// A user whose folders are empty.
class UserDefaultsWorld : public World {
 public:
  virtual ApplicationStorage& storage() = 0;
  /// That of another process of the same user.
  virtual ApplicationStorage& storageOfAnother() = 0;
};
using UserDefaultsContract = Suite<UserDefaultsWorld>;

}  // namespace Varnel::Platform::Contract
