// SPDX-License-Identifier: MIT
#pragma once

#include <string>
#include <string_view>

namespace Orvane {

/// The text in a form that shows on a terminal as what it is and keeps to one line: control
/// characters, characters that turn the direction of writing or break lines, and bytes that are not
/// UTF-8 become "\n", "\t" and so on or "\xNN" for each byte; a backslash becomes "\\".
///
///     visibleText("a\nb\xff");  // a\nb\xFF
[[nodiscard]] std::string visibleText(std::string_view bytes);

/// Whether all of the bytes are UTF-8.
[[nodiscard]] bool isUTF8(std::string_view bytes);

}  // namespace Orvane
