// SPDX-License-Identifier: MIT
#pragma once

#include <string_view>

namespace Varnel::Platform {

/// Whether the text of an element in an XML property list is exactly one value. The parser behind
/// `parsePropertyList` makes a value of any text.
///
/// Whole numbers are decimal without leading zeros or hexadecimal ("0x1F"), and fit 64 bits, with
/// or without a sign; reals fit a double. Blanks may stand around numbers.
[[nodiscard]] bool isWholeNumber(std::string_view text);
[[nodiscard]] bool isReal(std::string_view text);
/// A moment that the calendar has: "2024-02-29T12:00:00Z".
[[nodiscard]] bool isDate(std::string_view text);

}  // namespace Varnel::Platform
