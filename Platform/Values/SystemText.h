// SPDX-License-Identifier: MIT
#pragma once

#include <string_view>

namespace Varnel::Platform {

/// Whether the system would take the text for no more than what stands before a null character.
/// As a path, a name or an argument such a text leads elsewhere, so ports refuse it
/// (`invalid_argument`), or find nothing under it. Any thread.
[[nodiscard]] inline bool isCutShort(std::string_view text) {
  return text.find('\0') != std::string_view::npos;
}

}  // namespace Varnel::Platform
