// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <string>
#include <string_view>

#include <Varnel/Platform/Api.h>

namespace Varnel::Platform {

/// How many bytes make a KB: 1000 for `file` and `decimal`, 1024 for `memory` and `binary`.
enum class ByteCountStyle { file, memory, decimal, binary };

/// The factor from each unit to the next.
[[nodiscard]] constexpr std::uint64_t unitStep(ByteCountStyle style) {
  return style == ByteCountStyle::memory || style == ByteCountStyle::binary ? 1024 : 1000;
}

/// Writes byte counts for people: "Zero KB", "999 bytes", "1,016 KB", "1.5 MB", "2.25 GB".
///
///     ByteCountFormatter("en_US").string(1'500'000, ByteCountStyle::file);  // "1.5 MB"
///
/// KB have no decimals, MB at most one, GB and above at most two, halves rounded up and trailing
/// zeros dropped. Immutable; any thread.
class VARNEL_API ByteCountFormatter final {
 public:
  /// The locale, an ICU identifier, gives the separators; digits and units are the same in all.
  explicit ByteCountFormatter(std::string_view localeIdentifier);

  /// The text of `count` bytes; a negative count has a leading minus.
  [[nodiscard]] std::string string(std::int64_t count, ByteCountStyle style) const;

 private:
  [[nodiscard]] std::string wholeText(std::uint64_t number) const;

  std::string groupingSeparator_;
  std::string decimalSeparator_;
};

}  // namespace Varnel::Platform
