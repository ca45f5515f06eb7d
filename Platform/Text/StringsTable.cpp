// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Text/StringsTable.h>

#include <Varnel/Platform/Text/PropertyListParser.h>

namespace Varnel::Platform {

std::optional<StringsTable> parseStringsTable(std::string_view bytes) {
  const auto list = parsePropertyList(bytes);
  const auto* dictionary = list ? list->as<PropertyDictionary>() : nullptr;
  if (!dictionary) return std::nullopt;
  StringsTable table;
  for (const auto& [key, value] : *dictionary)
    if (const auto* text = value.as<std::string>()) table.emplace_hint(table.end(), key, *text);
  return table;
}

}  // namespace Varnel::Platform
