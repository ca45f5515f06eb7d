// SPDX-License-Identifier: MIT
#pragma once

#include <map>
#include <optional>
#include <string>
#include <string_view>

#include <Varnel/Platform/Api.h>

namespace Varnel::Platform {

/// The texts of one language by key.
using StringsTable = std::map<std::string, std::string, std::less<>>;

/// The strings table that the bytes of a property list hold: a dictionary of texts. Values of any
/// other type are left out; absent when the bytes are no property list or no dictionary.
///
///     if (const auto table = parseStringsTable(bytes))
///       if (const auto text = table->find("Quit"); text != table->end()) use(text->second);
///
/// Any thread.
[[nodiscard]] VARNEL_API std::optional<StringsTable> parseStringsTable(std::string_view bytes);

}  // namespace Varnel::Platform
