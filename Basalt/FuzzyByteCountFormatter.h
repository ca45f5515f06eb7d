// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <string>
#include <string_view>

#include <Varnel/Platform/Api.h>
#include <Varnel/Platform/Text/ByteCountFormatter.h>

namespace Basalt {

/// Writes byte counts so coarsely that a file cannot be told by its size: rounded up to 1, 2, 5,
/// 10, 20, 50, 100, 200 or 500 of a unit, KB being the least.
///
///     FuzzyByteCountFormatter("en_US").string(1'234'567, ByteCountStyle::file);  // "2 MB"
///
/// Immutable; any thread.
class VARNEL_API FuzzyByteCountFormatter final {
 public:
  explicit FuzzyByteCountFormatter(std::string_view localeIdentifier);

  /// The text of about `count` bytes; zero stays "Zero KB", a negative count has a leading minus.
  [[nodiscard]] std::string string(std::int64_t count,
                                   Varnel::Platform::ByteCountStyle style) const;

 private:
  Varnel::Platform::ByteCountFormatter formatter_;
};

}  // namespace Basalt
