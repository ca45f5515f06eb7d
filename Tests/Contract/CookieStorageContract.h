// SPDX-License-Identifier: MIT
#pragma once

#include <Tests/Contract/Contract.h>
#include <Varnel/Platform/Ports/CookieStorage.h>

namespace Varnel::Platform::Contract {

/// A user of whom nobody has kept a cookie yet.
class CookieStorageWorld : public World {
 public:
  virtual CookieStorage& storage() = 0;
  /// Fills this application's own store, or that of a group.
  virtual void fillOwn(const std::vector<Cookie>& cookies) = 0;
  virtual void fillGroup(const std::string& identifier, const std::vector<Cookie>& cookies) = 0;
};
using CookieStorageContract = Suite<CookieStorageWorld>;

}  // namespace Varnel::Platform::Contract
