// SPDX-License-Identifier: MIT
#include <Platform/Text/PropertyListParser.h>
namespace Varnel::Platform {
std::optional<PropertyValue> parsePropertyList(std::string_view) {
  return std::nullopt;
}
}  // namespace Varnel::Platform
