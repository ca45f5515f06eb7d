// SPDX-License-Identifier: MIT
#pragma once

#include <string_view>

#include <Varnel/Platform/Api.h>

namespace Varnel::Platform {

/// The system's own log, for code below the framework's logger. Any thread.
class VARNEL_API SystemLog {
 public:
  virtual ~SystemLog() = default;
  SystemLog& operator=(const SystemLog&) = delete;

  /// Writes one line, without terminator. Control characters, and bytes that are not UTF-8, show as
  /// `visibleText` shows them: nothing in a text can pass for a line of its own. Never fails
  /// visibly.
  virtual void write(std::string_view line) = 0;
};

}  // namespace Varnel::Platform
