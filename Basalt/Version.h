// SPDX-License-Identifier: MIT
#pragma once

#include <compare>
#include <string>
#include <string_view>
#include <vector>

#include <Varnel/Platform/Api.h>

namespace Basalt {

/// A version of numbers between dots, ordered number by number: 1.10 follows 1.9, and 1.0 equals 1.
///
///     Version("2.1.3") < Version("2.10");  // true
///
/// A value.
class VARNEL_API Version final {
 public:
  /// Reads numbers up to the first thing that is not one: "2.1b3 (7)" is 2.1. A text that does not
  /// start with a number is version 0; a number beyond 32 bits counts as the largest.
  explicit Version(std::string_view text);

  /// The number at `index`, 0 beyond the end.
  [[nodiscard]] unsigned component(std::size_t index) const;

  /// The numbers joined by dots, "0" when there are none; trailing zeros are dropped.
  [[nodiscard]] std::string string() const;

  bool operator==(const Version&) const = default;
  std::strong_ordering operator<=>(const Version&) const = default;

 private:
  std::vector<unsigned> components_;
};

}  // namespace Basalt
