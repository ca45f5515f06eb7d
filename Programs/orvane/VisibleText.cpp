// SPDX-License-Identifier: MIT
#include <orvane/VisibleText.h>

#include <cstddef>

namespace Orvane {
namespace {

/// A character at the beginning of some bytes: how many it takes, 0 when they are not UTF-8.
struct Character {
  std::size_t length = 0;
  char32_t code = 0;
};

Character firstCharacter(std::string_view bytes) {
  const auto byte = [&](std::size_t i) { return static_cast<unsigned char>(bytes[i]); };
  const unsigned char lead = byte(0);
  if (lead < 0x80) return {1, lead};
  const std::size_t length = lead >= 0xF0 ? 4 : lead >= 0xE0 ? 3 : 2;
  if (lead < 0xC2 || lead > 0xF4 || bytes.size() < length) return {};
  char32_t code = lead & (0xFFu >> (length + 1));
  for (std::size_t i = 1; i < length; ++i) {
    if ((byte(i) & 0xC0) != 0x80) return {};
    code = code << 6 | (byte(i) & 0x3Fu);
  }
  constexpr char32_t leastOfLength[] = {0, 0, 0x80, 0x800, 0x10000};
  const bool isSurrogate = code >= 0xD800 && code <= 0xDFFF;
  if (code < leastOfLength[length] || isSurrogate || code > 0x10FFFF) return {};
  return {length, code};
}

bool isDeceptive(char32_t code) {
  const auto isIn = [&](char32_t first, char32_t last) { return code >= first && code <= last; };
  return code < 0x20 || isIn(0x7F, 0x9F) || code == 0x61C ||  // controls, Arabic letter mark
         isIn(0x200E, 0x200F) || isIn(0x2028, 0x202E) ||      // direction and line marks
         isIn(0x2066, 0x2069) || code == 0xFEFF;
}

void appendEscaped(std::string& text, std::string_view bytes) {
  constexpr std::string_view letters = "abtnvfr";  // from 0x07 on
  constexpr char digits[] = "0123456789ABCDEF";
  for (const char c : bytes) {
    const auto byte = static_cast<unsigned char>(c);
    text += '\\';
    if (byte >= 0x07 && byte < 0x07 + letters.size()) {
      text += letters[byte - 0x07u];
    } else {
      text += 'x';
      text += digits[byte >> 4];
      text += digits[byte & 0xF];
    }
  }
}

}  // namespace

std::string visibleText(std::string_view bytes) {
  std::string text;
  text.reserve(bytes.size());
  while (!bytes.empty()) {
    const Character character = firstCharacter(bytes);
    const std::string_view taken = bytes.substr(0, character.length == 0 ? 1 : character.length);
    if (character.length == 0 || isDeceptive(character.code)) {
      appendEscaped(text, taken);
    } else if (character.code == U'\\') {
      text += "\\\\";
    } else {
      text += taken;
    }
    bytes.remove_prefix(taken.size());
  }
  return text;
}

bool isUTF8(std::string_view bytes) {
  while (!bytes.empty()) {
    const std::size_t length = firstCharacter(bytes).length;
    if (length == 0) return false;
    bytes.remove_prefix(length);
  }
  return true;
}

}  // namespace Orvane
