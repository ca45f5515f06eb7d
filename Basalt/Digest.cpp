// SPDX-License-Identifier: MIT
#include <Varnel/Basalt/Digest.h>

#include <sys/types.h>

#include <cstdint>

#include <sha256.h>

namespace Basalt {

std::string sha256(std::string_view bytes) {
  SHA256_CTX state;
  SHA256_Init(&state);
  SHA256_Update(&state, reinterpret_cast<const std::uint8_t*>(bytes.data()), bytes.size());
  std::string digest(SHA256_DIGEST_LENGTH, '\0');
  SHA256_Final(reinterpret_cast<std::uint8_t*>(digest.data()), &state);
  return digest;
}

std::string hexadecimal(std::string_view bytes) {
  constexpr std::string_view digits = "0123456789abcdef";
  std::string text;
  text.reserve(2 * bytes.size());
  for (const char c : bytes) {
    const auto byte = static_cast<unsigned char>(c);
    text += digits[byte >> 4];
    text += digits[byte & 0x0F];
  }
  return text;
}

}  // namespace Basalt
