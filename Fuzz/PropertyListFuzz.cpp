// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Text/PropertyListParser.h>

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <cstdlib>

namespace {

using namespace Varnel::Platform;

std::size_t depthOf(const PropertyValue& value) {
  std::size_t deepest = 0;
  if (const auto* list = value.as<PropertyList>()) {
    for (const PropertyValue& element : *list) deepest = std::max(deepest, depthOf(element));
    return deepest + 1;
  }
  if (const auto* dictionary = value.as<PropertyDictionary>()) {
    for (const auto& [key, element] : *dictionary) deepest = std::max(deepest, depthOf(element));
    return deepest + 1;
  }
  return 0;
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const auto value = parsePropertyList({reinterpret_cast<const char*>(data), size});
  if (value && depthOf(*value) > 512) std::abort();
  return 0;
}
