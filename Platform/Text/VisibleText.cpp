// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Text/VisibleText.h>

#include <unicode/utf8.h>

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <string_view>

namespace Varnel::Platform {
namespace {

// An object rather than a function, so that the search can inline it.
constexpr auto isPlain = [](char c) { return c >= 0x20 && c < 0x7F && c != '\\'; };

/// Whether the character must not reach a terminal as it is; negative ones stand for wrong bytes.
constexpr bool isDeceptive(UChar32 character) {
  const auto isIn = [character](UChar32 first, UChar32 last) {
    return first <= character && character <= last;
  };
  return character < 0x20 || isIn(0x7F, 0x9F)  // control characters
         || isIn(0x2028, 0x2029)               // separators of lines and of paragraphs
         || character == 0x061C || isIn(0x200E, 0x200F) || isIn(0x202A, 0x202E) ||
         isIn(0x2066, 0x2069)     // directions of writing
         || character == 0xFEFF;  // the byte order mark
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

std::string visibleText(std::string text, Backslashes backslashes) {
  const auto* bytes = reinterpret_cast<const std::uint8_t*>(text.data());
  const std::string_view whole = text;
  // Nearly all text is plain, and every caller of the logger waits for this.
  const auto special = std::find_if_not(whole.begin(), whole.end(), isPlain);
  if (special == whole.end()) return text;
  std::string shown;
  std::size_t done = 0;  // what `shown` holds of the text
  auto start = static_cast<std::size_t>(special - whole.begin());
  for (std::size_t end = start; end < whole.size(); start = end) {
    UChar32 character = 0;
    U8_NEXT(bytes, end, whole.size(), character);
    const bool isDoubled = character == '\\' && backslashes == Backslashes::doubled;
    if (!isDoubled && !isDeceptive(character)) continue;
    shown += whole.substr(done, start - done);
    if (isDoubled)
      shown += "\\\\";
    else
      appendEscaped(shown, whole.substr(start, end - start));
    done = end;
  }
  if (done == 0) return text;
  return shown += whole.substr(done);
}

}  // namespace Varnel::Platform
