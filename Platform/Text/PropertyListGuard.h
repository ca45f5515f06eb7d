// SPDX-License-Identifier: MIT
#pragma once

#include <string_view>

namespace Varnel::Platform {

/// Whether the parser behind `parsePropertyList` may be given these bytes: whether it will stay
/// within the stack, a few hundred megabytes and a few seconds, and will not make up a number or a
/// date. The answer says nothing about whether they are a property list; what is unusual enough to
/// be read in two ways is refused.
[[nodiscard]] bool isTameXML(std::string_view bytes);
[[nodiscard]] bool isTameBinary(std::string_view bytes);

}  // namespace Varnel::Platform
