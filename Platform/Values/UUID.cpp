// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Values/UUID.h>

#include <algorithm>
#include <array>
#include <cstdint>
#include <functional>
#include <string_view>

namespace Varnel::Platform {
namespace {

using Words = std::array<std::uint32_t, 4>;

std::string textOf(const Words& words) {
  constexpr std::string_view hexDigits = "0123456789ABCDEF";
  std::array<unsigned char, 16> bytes{};
  for (std::size_t i = 0; i < bytes.size(); ++i)
    bytes[i] = static_cast<unsigned char>(words[i / 4] >> (8 * (i % 4)));
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

std::mt19937_64 seededEngine() {
  std::random_device random;
  std::array<std::uint32_t, 8> seed{};
  std::generate(seed.begin(), seed.end(), std::ref(random));
  std::seed_seq sequence(seed.begin(), seed.end());
  return std::mt19937_64(sequence);
}

}  // namespace

std::string randomUUIDString() {
  // The system's randomness needs no library. A library's state may be gone while the process
  // exits, when an inventory may still be under way.
  std::random_device random;
  Words words{};
  std::generate(words.begin(), words.end(), std::ref(random));
  return textOf(words);
}

UUIDGenerator::UUIDGenerator() : engine_(seededEngine()) {}

std::string UUIDGenerator::next() {
  Words words{};
  for (std::size_t i = 0; i < words.size(); i += 2) {
    const std::uint64_t number = engine_();
    words[i] = static_cast<std::uint32_t>(number);
    words[i + 1] = static_cast<std::uint32_t>(number >> 32);
  }
  return textOf(words);
}

}  // namespace Varnel::Platform
