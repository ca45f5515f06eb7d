// SPDX-License-Identifier: MIT
#pragma once

#include <string_view>

#include <Varnel/Platform/Api.h>

namespace Basalt {

/// Stops the process because code was reached that cannot be reached in a sound build; the line on
/// standard error names the place. In release builds too.
[[noreturn]] VARNEL_API void assertUnreachable(std::string_view file, int line);

/// Reports that an operation which subclasses must override was called on the base class. Stops the
/// process in debug builds and does nothing in release builds.
VARNEL_API void QNAssertAbstract(std::string_view operation);

}  // namespace Basalt
