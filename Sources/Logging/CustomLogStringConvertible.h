// SPDX-License-Identifier: MIT
#pragma once

#include <string>

#include <Varnel/Platform/Api.h>

namespace Varnel {

/// Something that has a text of its own for the log. The logger looks for it in every error,
/// standard exceptions included.
class VARNEL_API CustomLogStringConvertible {
 public:
  constexpr virtual ~CustomLogStringConvertible() = default;

  [[nodiscard]] virtual std::string logDescription() const = 0;

 protected:
  CustomLogStringConvertible() = default;
  CustomLogStringConvertible(const CustomLogStringConvertible&) = default;
  CustomLogStringConvertible& operator=(const CustomLogStringConvertible&) = default;
};

/// Lets a type with a `description()` use that text for the log as well, without further code:
///
///     class ScanError final : public Error, public LogsItsDescription<ScanError> { … };
template <typename Described>
class LogsItsDescription : public CustomLogStringConvertible {
 public:
  [[nodiscard]] std::string logDescription() const override {
    return std::string(static_cast<const Described&>(*this).description());
  }
};

}  // namespace Varnel
