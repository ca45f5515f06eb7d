// SPDX-License-Identifier: MIT
#include <Platform/Values/PercentEncoding.h>

namespace Varnel::Platform {
namespace {

constexpr std::string_view hexDigits = "0123456789ABCDEF";

int hexValue(char c) {
  if (c >= '0' && c <= '9') return c - '0';
  if (c >= 'A' && c <= 'F') return c - 'A' + 10;
  if (c >= 'a' && c <= 'f') return c - 'a' + 10;
  return -1;
}

bool isEscape(std::string_view text) {
  return text.size() >= 3 && text[0] == '%' && hexValue(text[1]) >= 0 && hexValue(text[2]) >= 0;
}

void appendEscape(std::string& out, char c) {
  const auto byte = static_cast<unsigned char>(c);
  const char escape[] = {'%', hexDigits[byte >> 4], hexDigits[byte & 0x0F]};
  out.append(escape, sizeof escape);
}

// Appends runs of allowed bytes whole; `stays` may let further bytes pass.
template <typename Stays>
void appendEncoded(std::string& out, std::string_view text, const ByteSet& allowed, Stays stays) {
  std::size_t run = 0;
  for (std::size_t i = 0; i < text.size(); ++i) {
    if (contains(allowed, text[i]) || stays(text.substr(i))) continue;
    out.append(text, run, i - run);
    appendEscape(out, text[i]);
    run = i + 1;
  }
  out.append(text, run);
}

}  // namespace

std::size_t percentEncodedSize(std::string_view text, const ByteSet& allowed) {
  std::size_t size = text.size();
  for (const char c : text) size += contains(allowed, c) ? 0 : 2;
  return size;
}

void appendPercentEncoded(std::string& out, std::string_view text, const ByteSet& allowed) {
  appendEncoded(out, text, allowed, [](std::string_view) { return false; });
}

void appendPercentRepaired(std::string& out, std::string_view text, const ByteSet& allowed) {
  appendEncoded(out, text, allowed, isEscape);
}

std::string percentDecoded(std::string_view text) {
  std::string decoded;
  decoded.reserve(text.size());
  for (std::size_t i = 0; i < text.size(); ++i) {
    if (isEscape(text.substr(i))) {
      decoded += static_cast<char>(hexValue(text[i + 1]) * 16 + hexValue(text[i + 2]));
      i += 2;
    } else {
      decoded += text[i];
    }
  }
  return decoded;
}

}  // namespace Varnel::Platform
