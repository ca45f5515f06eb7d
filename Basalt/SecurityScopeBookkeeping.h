// SPDX-License-Identifier: MIT
#pragma once

#include <cstddef>
#include <map>
#include <mutex>
#include <string>
#include <string_view>
#include <utility>

#include <Varnel/Platform/Api.h>
#include <Varnel/Platform/Values/URL.h>

namespace Varnel::Platform {
class SecurityScope;
}

namespace Basalt {

/// Remembers who has opened the sandbox's gate in front of which file, and for what.
///
///     if (scopes.beginAccessingSecurityScopedResource(url, "scan")) {
///       read(url);
///       scopes.endAccessingSecurityScopedResource(url, "scan");
///     }
///
/// Any thread. Ending an access that was not begun does nothing, so that nobody else's gate is
/// closed. Destruction leaves open gates open. The scope outlives the object.
class VARNEL_API SecurityScopeBookkeeping final {
 public:
  using URL = Varnel::Platform::URL;

  explicit SecurityScopeBookkeeping(Varnel::Platform::SecurityScope& scope);
  SecurityScopeBookkeeping(const SecurityScopeBookkeeping&) = delete;
  SecurityScopeBookkeeping& operator=(const SecurityScopeBookkeeping&) = delete;

  /// False when the process may not access the file. Each success needs one end.
  [[nodiscard]] bool beginAccessingSecurityScopedResource(const URL& url, std::string_view propose);
  void endAccessingSecurityScopedResource(const URL& url, std::string_view propose);

  /// How many accesses of this purpose are open.
  [[nodiscard]] std::size_t openAccesses(const URL& url, std::string_view propose) const;

 private:
  Varnel::Platform::SecurityScope& scope_;
  mutable std::mutex mutex_;  ///< Owns `open_`; not held while the system is asked.
  std::map<std::pair<URL, std::string>, std::size_t> open_;
};

}  // namespace Basalt
