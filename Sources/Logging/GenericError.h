// SPDX-License-Identifier: MIT
#pragma once

#include <Varnel/Logging/CustomLogStringConvertible.h>
#include <Varnel/Logging/Error.h>

namespace Varnel {

/// For code that must give an error of its own kind and cannot convert the one that it caught. A
/// value.
///
///     return GenericError::fallback;
class VARNEL_API GenericError final : public Error, public CustomLogStringConvertible {
 public:
  enum class Case : int { fallback = 0 };
  static const GenericError fallback;

  constexpr ~GenericError() override {}
  GenericError(const GenericError&) = default;
  GenericError& operator=(const GenericError&) = default;

  [[nodiscard]] Case case_() const { return kind_; }

  [[nodiscard]] std::string_view typeName() const override { return "GenericError"; }
  [[nodiscard]] long code() const override { return static_cast<long>(kind_); }
  [[nodiscard]] std::string description() const override { return "fallback"; }
  /// A fixed sentence; its odd spelling is what readers of logs search for.
  [[nodiscard]] std::string logDescription() const override {
    return "Did fail to catch specifi error. Falling back to generic error.";
  }

  bool operator==(const GenericError& other) const { return kind_ == other.kind_; }

 private:
  explicit constexpr GenericError(Case kind) : kind_(kind) {}

  Case kind_;
};

inline constexpr GenericError GenericError::fallback{Case::fallback};

}  // namespace Varnel
