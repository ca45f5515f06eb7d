// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <string>

#include <Platform/Api.h>
#include <Platform/Values/PropertyValue.h>

namespace Varnel::Platform {

/// The value as an XML property list, which `parsePropertyList` reads back. Absent when it holds
/// something that the format cannot carry: a text or key that is not UTF-8 or has control
/// characters, a whole number below zero, a date more than 68 years from 2001. Any thread.
[[nodiscard]] VARNEL_API std::optional<std::string> writePropertyList(const PropertyValue& value);

}  // namespace Varnel::Platform
