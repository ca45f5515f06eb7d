// SPDX-License-Identifier: MIT
#pragma once

#include <array>
#include <cstddef>
#include <string>
#include <string_view>

namespace Varnel::Platform {

/// A set of bytes, asked in constant time: `allowed[byte]`.
using ByteSet = std::array<bool, 256>;

/// The letters and digits of ASCII, and `others`.
constexpr ByteSet alphanumericAnd(std::string_view others) {
  ByteSet set{};
  for (char c = '0'; c <= '9'; ++c) set[static_cast<unsigned char>(c)] = true;
  for (char c = 'A'; c <= 'Z'; ++c) set[static_cast<unsigned char>(c)] = true;
  for (char c = 'a'; c <= 'z'; ++c) set[static_cast<unsigned char>(c)] = true;
  for (const char c : others) set[static_cast<unsigned char>(c)] = true;
  return set;
}

[[nodiscard]] constexpr bool contains(const ByteSet& set, char c) {
  return set[static_cast<unsigned char>(c)];
}

/// What may stand in a path as it is (RFC 3986, section 3.3).
inline constexpr ByteSet pathBytes = alphanumericAnd("-._~!$&'()*+,;=:@/");

/// The most bytes that one byte encoded takes.
inline constexpr std::size_t percentEncodedByteSize = 3;

/// Writes `text` as `appendPercentEncoded` does, to where there is room for the worst case, and
/// returns the end of what was written.
[[nodiscard]] char* writePercentEncoded(char* out, std::string_view text, const ByteSet& allowed);

/// Appends `text`, each byte outside `allowed` as "%" and two upper-case digits.
void appendPercentEncoded(std::string& out, std::string_view text, const ByteSet& allowed);

/// The same for a text that may hold escapes already: a "%" before two hexadecimal digits stays.
void appendPercentRepaired(std::string& out, std::string_view text, const ByteSet& allowed);

/// The bytes behind the escapes. A "%" that begins no escape stands for itself.
[[nodiscard]] std::string percentDecoded(std::string_view text);

}  // namespace Varnel::Platform
