// SPDX-License-Identifier: MIT
#pragma once

#include <Varnel/Platform/Api.h>

namespace Varnel {

/// A place in the source code. As a default argument it is the place of the call:
///
///     void log(std::string_view message, SourcePosition where = SourcePosition::current());
///
/// It stands in for `std::source_location`, which not every supported compiler has, and whose
/// spelling of functions is different in each. The texts are literals and live for ever.
struct SourcePosition {
  const char* file;
  const char* function;  ///< The bare name: no type, no scope, no parameters.
  int line;

  [[nodiscard]] static constexpr SourcePosition current(const char* file = __builtin_FILE(),
                                                        const char* function = __builtin_FUNCTION(),
                                                        int line = __builtin_LINE()) {
    return {file, function, line};
  }
};

}  // namespace Varnel
