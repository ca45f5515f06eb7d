// SPDX-License-Identifier: MIT
#pragma once

#include <string>
#include <vector>

#include <Varnel/Platform/Api.h>

namespace Varnel::Platform {

/// A cookie as a server set it, with what identifies it.
struct Cookie {
  std::string domain;  ///< With a leading dot for all hosts below it.
  std::string path;
  std::string name;
  std::string value;

  bool operator==(const Cookie&) const = default;
};

/// The cookie stores of this user's applications. Any thread; calls read files. A store that is
/// missing or cannot be read is empty.
class VARNEL_API CookieStorage {
 public:
  virtual ~CookieStorage() = default;
  CookieStorage& operator=(const CookieStorage&) = delete;

  /// Whether applications of a group can share a store.
  [[nodiscard]] virtual bool hasGroupContainers() const = 0;

  /// The cookies of this application's own store that have not expired, in the store's order.
  [[nodiscard]] virtual std::vector<Cookie> cookies() = 0;

  /// The same for the store shared by the group with this identifier.
  [[nodiscard]] virtual std::vector<Cookie> cookiesOfGroupContainer(
      const std::string& identifier) = 0;
};

}  // namespace Varnel::Platform
