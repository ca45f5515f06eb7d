// SPDX-License-Identifier: MIT
#include <Platform/Values/UUID.h>

#include <array>
#include <cstdlib>

#include <fmt/format.h>
#include <openssl/rand.h>

namespace Varnel::Platform {

std::string randomUUIDString() {
  std::array<unsigned char, 16> bytes{};
  // A system without randomness cannot tell two disks apart; nothing sensible can follow.
  if (RAND_bytes(bytes.data(), static_cast<int>(bytes.size())) != 1) std::abort();
  bytes[6] = static_cast<unsigned char>((bytes[6] & 0x0F) | 0x40);
  bytes[8] = static_cast<unsigned char>((bytes[8] & 0x3F) | 0x80);
  std::string text;
  text.reserve(36);
  for (std::size_t i = 0; i < bytes.size(); ++i) {
    if (i == 4 || i == 6 || i == 8 || i == 10) text += '-';
    fmt::format_to(std::back_inserter(text), "{:02X}", bytes[i]);
  }
  return text;
}

}  // namespace Varnel::Platform
