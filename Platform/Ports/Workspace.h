// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <string>

#include <Varnel/Platform/Api.h>
#include <Varnel/Platform/Values/URL.h>

namespace Varnel::Platform {

/// Knows the applications installed for this user. Any thread; a call may read files.
class VARNEL_API Workspace {
 public:
  virtual ~Workspace() = default;
  Workspace& operator=(const Workspace&) = delete;

  /// Where the application with this bundle identifier is: its bundle folder (a URL
  /// with a slash at its end) where it has one, else its executable. Identifiers are compared
  /// exactly, and an empty one is nobody's. Absent when none is installed at present.
  [[nodiscard]] virtual std::optional<URL> applicationURL(const std::string& bundleIdentifier) = 0;
};

}  // namespace Varnel::Platform
