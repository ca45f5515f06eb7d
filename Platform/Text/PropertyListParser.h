// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <string_view>

#include <Varnel/Platform/Api.h>
#include <Varnel/Platform/Values/PropertyValue.h>

namespace Varnel::Platform {

/// The value that the bytes of a property list, XML or binary, stand for; absent when they are
/// none.
///
///     if (const auto list = parsePropertyList(bytes))
///       if (const auto* facts = list->as<PropertyDictionary>()) use(*facts);
///
/// The bytes may come from anywhere: lists that are damaged, cyclic, nested more than 512 deep,
/// larger than 16 MiB, have more than some 16,000 keys in one dictionary or zero characters in a
/// text are refused. So are lists with a malformed number or date, one with something behind it, or
/// a number that does not fit 64 bits. If a key comes twice, the last one counts. A unique
/// identifier is read as its number, a number beyond the signed range as its 64 bits; dates that
/// `Date` does not reach are left out. The host's `setlocale` makes no difference. Any thread.
[[nodiscard]] VARNEL_API std::optional<PropertyValue> parsePropertyList(std::string_view bytes);

}  // namespace Varnel::Platform
