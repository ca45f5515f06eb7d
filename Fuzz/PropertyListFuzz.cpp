// SPDX-License-Identifier: MIT
// Property lists and strings tables. What is written again is read as the same.
#include <algorithm>

#include <Fuzz/Fuzz.h>
#include <Varnel/Platform/Text/PropertyListParser.h>
#include <Varnel/Platform/Text/PropertyListWriter.h>
#include <Varnel/Platform/Text/StringsTable.h>

using namespace Varnel::Platform;

static std::size_t depthOf(const PropertyValue& value) {
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

static void fuzz(std::string_view input) {
  const auto value = parsePropertyList(input);
  const auto* dictionary = value ? value->as<PropertyDictionary>() : nullptr;
  const auto table = parseStringsTable(input);
  require(table.has_value() == (dictionary != nullptr));
  if (table)
    for (const auto& [key, text] : *table) require(*findAs<std::string>(*dictionary, key) == text);
  if (!value) return;
  require(depthOf(*value) <= 512);
  if (const auto written = writePropertyList(*value)) {
    const auto again = parsePropertyList(*written);
    require(again && writePropertyList(*again) == written);
  }
}
