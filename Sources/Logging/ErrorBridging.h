// SPDX-License-Identifier: MIT
#pragma once

#include <exception>
#include <string>
#include <string_view>

#include <Platform/Api.h>
#include <Platform/Values/PlatformError.h>

namespace Varnel {

// How the errors of C++ itself become platform errors. (A `std::error_code` is one by construction:
// `PlatformError(code)`.) Any thread.
//
//     catch (const std::exception& caught) { presentAlert(platformError(caught)); }

/// The name, without scope, of the most derived standard type that the exception is: "out_of_range"
/// for a host's own class derived from it. Literal texts; nothing is demangled.
[[nodiscard]] VARNEL_API std::string_view standardTypeName(const std::exception& exception);

/// An exception with an error code (`std::system_error` and its kin, `std::future_error`) keeps the
/// category's name as domain and the code's value; any other has the domain "std.", the standard
/// type's name, and code 0. The description is `what()`.
[[nodiscard]] VARNEL_API Platform::PlatformError platformError(const std::exception& exception);

/// What the log says of a platform error: "NSError: " and its description.
[[nodiscard]] VARNEL_API std::string logDescription(const Platform::PlatformError& error);

}  // namespace Varnel
