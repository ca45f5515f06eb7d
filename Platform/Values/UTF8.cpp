// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Values/UTF8.h>

#include <cstdint>
#include <cstring>

#include <unicode/utf8.h>

namespace Varnel::Platform {
namespace {

// Nearly all text is ASCII, which is recognised eight bytes at a time, and the last few one by one.
std::size_t lengthOfASCII(std::string_view bytes) {
  std::size_t length = 0;
  for (; length + sizeof(std::uint64_t) <= bytes.size(); length += sizeof(std::uint64_t)) {
    std::uint64_t word = 0;
    std::memcpy(&word, bytes.data() + length, sizeof word);
    if (word & 0x8080808080808080U) break;
  }
  while (length < bytes.size() && static_cast<unsigned char>(bytes[length]) < 0x80) ++length;
  return length;
}

}  // namespace

bool isValidUTF8(std::string_view bytes) {
  bytes.remove_prefix(lengthOfASCII(bytes));
  const auto* units = reinterpret_cast<const std::uint8_t*>(bytes.data());
  for (std::size_t next = 0; next < bytes.size();) {
    UChar32 character = 0;
    U8_NEXT(units, next, bytes.size(), character);
    if (character < 0) return false;
  }
  return true;
}

}  // namespace Varnel::Platform
