// SPDX-License-Identifier: MIT
#pragma once

#include <exception>
#include <string>

#include <Varnel/Platform/Api.h>
#include <Varnel/Platform/Values/PlatformError.h>

namespace Varnel {

// How the errors of C++ itself become platform errors. (A `std::error_code` is one by construction:
// `PlatformError(code)`.) Any thread.
//
//     catch (const std::exception& caught) { presentAlert(platformError(caught)); }

/// The name, without scope, of the exception's own type: "ImportFailure". An exception with another
/// nested in it has the name of the outer one's own type.
[[nodiscard]] VARNEL_API std::string typeName(const std::exception& exception);

/// An exception with an error code (`std::system_error` and its kin, `std::future_error`) keeps the
/// category's name as domain and the code's value; `Basalt::JSONError` has its kind as code. Any
/// other has code 0, and as domain the outermost namespace of its type, or the application's name
/// where there is none, a dot and the type's name: "Host.ImportFailure". The description is
/// `what()`; a nested exception becomes the underlying error.
[[nodiscard]] VARNEL_API Platform::PlatformError platformError(const std::exception& exception);

/// The log's text for a platform error: "NSError: " and its description.
[[nodiscard]] VARNEL_API std::string logDescription(const Platform::PlatformError& error);

}  // namespace Varnel
