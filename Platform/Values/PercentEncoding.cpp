// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Values/PercentEncoding.h>

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

char* writeEscape(char* out, char c) {
  const auto byte = static_cast<unsigned char>(c);
  out[0] = '%';
  out[1] = hexDigits[byte >> 4];
  out[2] = hexDigits[byte & 0x0F];
  return out + percentEncodedByteSize;
}

}  // namespace

char* writePercentEncoded(char* out, std::string_view text, const ByteSet& allowed) {
  for (const char c : text) {
    if (contains(allowed, c))
      *out++ = c;
    else
      out = writeEscape(out, c);
  }
  return out;
}

void appendPercentEncoded(std::string& out, std::string_view text, const ByteSet& allowed) {
  const std::size_t before = out.size();
  out.resize(before + text.size() * percentEncodedByteSize);
  const char* const end = writePercentEncoded(out.data() + before, text, allowed);
  out.resize(static_cast<std::size_t>(end - out.data()));
}

void appendPercentRepaired(std::string& out, std::string_view text, const ByteSet& allowed) {
  // Valid bytes, which are nearly all, are copied in runs.
  std::size_t run = 0;
  for (std::size_t i = 0; i < text.size(); ++i) {
    if (contains(allowed, text[i]) || isEscape(text.substr(i))) continue;
    out.append(text, run, i - run);
    char escape[percentEncodedByteSize];
    writeEscape(escape, text[i]);
    out.append(escape, sizeof escape);
    run = i + 1;
  }
  out.append(text, run);
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
