// SPDX-License-Identifier: MIT
#pragma once

#include <string>
#include <string_view>

#include <Varnel/Platform/Api.h>
#include <Varnel/Platform/Values/PlatformError.h>

namespace Varnel {

/// The base of error values: one class for each kind of error, with a code for each case.
///
///     class ScanError final : public Error {
///      public:
///       enum class Case { folderVanished, tooDeep };
///       std::string_view typeName() const override { return "ScanError"; }
///       std::string domain() const override { return "Orvane.ScanError"; }
///       long code() const override { return static_cast<long>(case_); }
///       …
///     };
///
/// Every error bridges to the platform error of its domain and code. An error type that is thrown
/// may derive from a standard exception as well. Errors are immutable values; any thread.
class VARNEL_API Error {
 public:
  constexpr virtual ~Error() = default;

  /// The type's name without scope, as a literal: "GenericError".
  [[nodiscard]] virtual std::string_view typeName() const = 0;

  /// The module's name, a dot and the type's name; here with this framework as the module.
  [[nodiscard]] virtual std::string domain() const;

  [[nodiscard]] virtual long code() const = 0;

  /// The same error as a platform error.
  [[nodiscard]] virtual Platform::PlatformError platformError() const;

  /// The text that stands for the error where it is named in passing.
  [[nodiscard]] virtual std::string description() const;

 protected:
  Error() = default;
  Error(const Error&) = default;
  Error& operator=(const Error&) = default;
};

}  // namespace Varnel
