// SPDX-License-Identifier: MIT
#pragma once

#include <string>

#include <Varnel/Platform/Api.h>

namespace Varnel::Platform {

/// What becomes of the backslashes that a text itself holds.
enum class Backslashes {
  doubled,  ///< No two texts look the same.
  kept,     ///< A text without anything to escape stays as it is.
};

/// The text in a form that a terminal shows as it is, on one line: control characters, characters
/// that turn the direction of writing or break lines, and bytes that are not UTF-8 become "\n",
/// "\t" and so on or "\xNN" for each byte.
///
///     visibleText("a\nb\xff");  // a\nb\xFF
///
/// Any thread.
[[nodiscard]] VARNEL_API std::string visibleText(std::string text,
                                                 Backslashes backslashes = Backslashes::doubled);

}  // namespace Varnel::Platform
