// SPDX-License-Identifier: MIT
#pragma once

#include <string_view>

namespace Varnel::Platform {

/// Whether the parser behind `parsePropertyList` may be given these bytes: whether it will stay
/// within the stack, a few hundred megabytes and a few seconds, and will not invent a number or a
/// date. The answer does not say that the bytes are a property list. Forms that can be read in two
/// ways are refused.
[[nodiscard]] bool isTameXML(std::string_view bytes);
[[nodiscard]] bool isTameBinary(std::string_view bytes);

}  // namespace Varnel::Platform
