// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Values/UTF8.h>

#include <cstdint>
#include <cstring>
#include <limits>

#include <unicode/ustring.h>

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
  if (bytes.empty()) return true;
  if (bytes.size() > std::numeric_limits<std::int32_t>::max()) return false;
  // Without a buffer the library only measures the text, and checks it on the way.
  UErrorCode status = U_ZERO_ERROR;
  ::u_strFromUTF8(nullptr, 0, nullptr, bytes.data(), static_cast<std::int32_t>(bytes.size()),
                  &status);
  return status != U_INVALID_CHAR_FOUND;
}

}  // namespace Varnel::Platform
