// SPDX-License-Identifier: MIT
#pragma once

#include <concepts>
#include <exception>
#include <string>
#include <string_view>
#include <system_error>

#include <Varnel/Logging/Error.h>
#include <Varnel/Platform/Api.h>
#include <Varnel/Platform/Values/PlatformError.h>

namespace Varnel {

/// The facts that the log keeps of an error. The framework's error values, platform errors,
/// standard exceptions and error codes all convert to it, so any of them can be handed to
/// `Logger::logError` as it is.
///
///     catch (const std::exception& exception) { logger.logError(exception, "Scanner"); }
///
/// An immutable value that refers to nothing.
class VARNEL_API LoggedError final {
 public:
  LoggedError(const Error& error);
  LoggedError(const Platform::PlatformError& error);
  /// An exception that is also an `Error` counts as an `Error`.
  LoggedError(const std::exception& exception);
  LoggedError(std::error_code code);

  /// For error values that derive from a standard exception as well, where the conversion would be
  /// ambiguous.
  template <typename Thrown>
  requires std::derived_from<Thrown, Error> && std::derived_from<Thrown, std::exception>
  LoggedError(const Thrown& error) : LoggedError(static_cast<const Error&>(error)) {}

  /// The name of the error's own type, without scope.
  [[nodiscard]] const std::string& typeName() const { return typeName_; }

  /// The error's own text for the log, or "NSError: " and the description of its platform error, in
  /// which control characters show escaped.
  [[nodiscard]] const std::string& logDescription() const { return logDescription_; }

  /// The error's plain text: its `description()`, or an exception's `what()`.
  [[nodiscard]] const std::string& description() const { return description_; }

 private:
  std::string typeName_;
  std::string logDescription_;
  std::string description_;
};

}  // namespace Varnel
