// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <string>
#include <string_view>

#include <Platform/Api.h>
#include <Platform/Text/ByteCountFormatter.h>

namespace Basalt {

/// Writes byte counts so coarsely that they tell the order of a size and not the size: the first
/// digit of the figure in its unit, and never less than one KB.
///
///     FuzzyByteCountFormatter("en_US").string(3'456'789, ByteCountStyle::file);  // "3 MB"
///
/// Immutable; any thread.
class VARNEL_API FuzzyByteCountFormatter final {
 public:
  /// The locale is an ICU identifier.
  explicit FuzzyByteCountFormatter(std::string_view localeIdentifier);

  /// The text of about `count` bytes; no bytes at all are told as they are.
  [[nodiscard]] std::string string(std::int64_t count,
                                   Varnel::Platform::ByteCountStyle style) const;

 private:
  Varnel::Platform::ByteCountFormatter exact_;
};

}  // namespace Basalt
