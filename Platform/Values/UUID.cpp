// SPDX-License-Identifier: MIT
#include <Platform/Values/UUID.h>

#include <array>
#include <cstdint>
#include <random>
#include <string_view>

namespace Varnel::Platform {

std::string randomUUIDString() {
  constexpr std::string_view hexDigits = "0123456789ABCDEF";
  // The system's randomness comes without a library whose state is gone once the process exits:
  // an inventory may still be under way by then.
  std::random_device random;
  std::array<unsigned char, 16> bytes{};
  for (std::size_t i = 0; i < bytes.size(); i += 4) {
    const std::uint32_t word = random();
    for (std::size_t j = 0; j < 4; ++j) bytes[i + j] = static_cast<unsigned char>(word >> (8 * j));
  }
  bytes[6] = static_cast<unsigned char>((bytes[6] & 0x0F) | 0x40);
  bytes[8] = static_cast<unsigned char>((bytes[8] & 0x3F) | 0x80);
  std::string text;
  text.reserve(36);
  for (std::size_t i = 0; i < bytes.size(); ++i) {
    if (i == 4 || i == 6 || i == 8 || i == 10) text += '-';
    text += hexDigits[bytes[i] >> 4];
    text += hexDigits[bytes[i] & 0x0F];
  }
  return text;
}

}  // namespace Varnel::Platform
