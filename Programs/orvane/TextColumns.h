// SPDX-License-Identifier: MIT
#pragma once

#include <cstddef>
#include <string>
#include <string_view>

namespace Orvane {

// Text as a terminal shows it: one that `visibleText` has made, in UTF-8 and without control
// characters. Characters of East Asia and pictures take two columns, marks on others none.

/// How many columns the text takes.
[[nodiscard]] std::size_t columnsOf(std::string_view text);

/// The text, cut in its middle where it takes more columns: the end of a path tells most. "..."
/// stands for what is left out.
[[nodiscard]] std::string fitted(std::string_view text, std::size_t maxColumns);

/// The text, with blanks up to so many columns.
[[nodiscard]] std::string padded(std::string text, std::size_t columns);

}  // namespace Orvane
