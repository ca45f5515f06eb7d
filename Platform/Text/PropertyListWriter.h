// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <string>

#include <Varnel/Platform/Api.h>
#include <Varnel/Platform/Values/PropertyValue.h>

namespace Varnel::Platform {

/// The value as an XML property list, which `parsePropertyList` reads back. Only fractions of
/// seconds are lost, because dates in this form have whole seconds. Absent when the value holds
/// something that the format cannot carry: a null, a text or key that is not UTF-8 or has control
/// characters, a whole number below zero, a date more than 68 years from 2001. The host's
/// `setlocale` makes no difference. Any thread.
[[nodiscard]] VARNEL_API std::optional<std::string> writePropertyList(const PropertyValue& value);

}  // namespace Varnel::Platform
