// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>

#include <Varnel/Platform/Values/PropertyValue.h>

namespace Varnel {

/// The number in a value: a number itself, a truth value as 1 or 0, or what a text begins with
/// after blanks; else 0. A number that does not fit becomes the nearest one that does. Any thread.
[[nodiscard]] double lenientReal(const Platform::PropertyValue& value);
/// The same without the fraction.
[[nodiscard]] std::int64_t lenientInteger(const Platform::PropertyValue& value);

}  // namespace Varnel
