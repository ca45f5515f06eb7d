// SPDX-License-Identifier: MIT
#pragma once

#include <string>

#include <Varnel/Platform/Api.h>

namespace Varnel::Platform {

/// The user that the process runs as. Any thread. Paths are absolute, with one "/" between names
/// and none at the end, except for the root "/".
class VARNEL_API UserAccount {
 public:
  virtual ~UserAccount() = default;
  UserAccount& operator=(const UserAccount&) = delete;

  /// What "~" stands for. The environment or a sandbox may have moved it away from the real home. A
  /// move to a relative path counts for nothing.
  [[nodiscard]] virtual std::string homeFolder() const = 0;

  /// The home folder in the system's own records of users.
  [[nodiscard]] virtual std::string realHomeFolder() const = 0;

  /// The user's account name.
  [[nodiscard]] virtual std::string name() const = 0;
};

}  // namespace Varnel::Platform
