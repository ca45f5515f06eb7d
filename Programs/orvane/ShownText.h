// SPDX-License-Identifier: MIT
#pragma once

#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>

namespace Orvane {

// How the program words and shows what all commands speak of.

/// "1 file", "2 files".
[[nodiscard]] std::string counted(std::uint64_t count, const char* singular, const char* plural);

/// "4.1 KB".
[[nodiscard]] std::string shownSize(std::uint64_t bytes);

/// A path as people read it: with "~" for the home folder, and as `visibleText` shows it.
[[nodiscard]] std::string shownPath(const std::string& path);

/// The text in lines of at most so many columns, broken between words: 0 where they may be of any
/// length. A longer word has a line of its own. What stands in quotes, as a path with blanks, is
/// one word.
[[nodiscard]] std::string wrapped(std::string_view text, std::size_t columns);

}  // namespace Orvane
