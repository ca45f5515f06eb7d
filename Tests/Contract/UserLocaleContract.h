// SPDX-License-Identifier: MIT
#pragma once

#include <vector>

#include <Tests/Contract/Contract.h>
#include <Varnel/Platform/Ports/UserLocale.h>

namespace Varnel::Platform::Contract {

/// A user who has chosen nothing yet.
class UserLocaleWorld : public World {
 public:
  virtual UserLocale& locale() = 0;
  /// Languages as in "de_AT", best first, and the locales of dates and numbers.
  virtual void choose(const std::vector<std::string>& languages, const std::string& dates,
                      const std::string& numbers) = 0;
};

using UserLocaleContract = Suite<UserLocaleWorld>;

}  // namespace Varnel::Platform::Contract
