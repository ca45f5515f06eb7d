// SPDX-License-Identifier: MIT
#pragma once

#include <Varnel/Platform/Api.h>
#include <Varnel/Platform/Values/URL.h>

namespace Varnel::Platform {

/// The sandbox's gate in front of files that the user has chosen. Any thread.
class VARNEL_API SecurityScope {
 public:
  virtual ~SecurityScope() = default;
  SecurityScope& operator=(const SecurityScope&) = delete;

  /// Opens the gate for a file or folder; false when the process may not read it, and for a URL
  /// that names no file of this machine. Every success needs one `stopAccessing`.
  [[nodiscard]] virtual bool startAccessing(const URL& url) = 0;
  virtual void stopAccessing(const URL& url) = 0;
};

}  // namespace Varnel::Platform
