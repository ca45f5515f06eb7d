// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <string_view>

#include <Platform/Api.h>
#include <Platform/Values/PropertyValue.h>

namespace Varnel::Platform {

/// The value that the bytes of a property list, XML or binary, stand for; absent when they are
/// none. The bytes may come from anywhere: damaged, cyclic or absurdly nested lists are refused.
/// Any thread.
[[nodiscard]] VARNEL_API std::optional<PropertyValue> parsePropertyList(std::string_view bytes);

}  // namespace Varnel::Platform
