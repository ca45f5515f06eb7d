// SPDX-License-Identifier: MIT
#include <Platform/Values/URL.h>

#include <array>
#include <cstdint>

namespace Varnel::Platform {
namespace {

constexpr std::string_view fileScheme = "file:";
constexpr std::string_view emptyAuthority = "//";
constexpr std::string_view hexDigits = "0123456789ABCDEF";

// RFC 3986, section 3.3: what may stand in a path unencoded.
constexpr auto pathBytes = [] {
  std::array<bool, 256> table{};
  for (const char c :
       std::string_view("ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789"
                        "-._~!$&'()*+,;=:@/"))
    table[static_cast<unsigned char>(c)] = true;
  return table;
}();

void appendPathEncoded(std::string& text, std::string_view path) {
  for (const char c : path) {
    const auto byte = static_cast<unsigned char>(c);
    if (pathBytes[byte]) {
      text += c;
    } else {
      text += '%';
      text += hexDigits[byte >> 4];
      text += hexDigits[byte & 0x0F];
    }
  }
}

int hexValue(char c) {
  if (c >= '0' && c <= '9') return c - '0';
  if (c >= 'A' && c <= 'F') return c - 'A' + 10;
  if (c >= 'a' && c <= 'f') return c - 'a' + 10;
  return -1;
}

std::string percentDecoded(std::string_view text) {
  std::string decoded;
  decoded.reserve(text.size());
  for (std::size_t i = 0; i < text.size(); ++i) {
    if (text[i] == '%' && i + 2 < text.size()) {
      const int high = hexValue(text[i + 1]);
      const int low = hexValue(text[i + 2]);
      if (high >= 0 && low >= 0) {
        decoded += static_cast<char>(high * 16 + low);
        i += 2;
        continue;
      }
    }
    decoded += text[i];
  }
  return decoded;
}

std::string_view withoutTrailingSlash(std::string_view path) {
  while (path.size() > 1 && path.back() == '/') path.remove_suffix(1);
  return path;
}

}  // namespace

URL URL::fileURLWithPath(std::string_view path) {
  std::string text;
  text.reserve(fileScheme.size() + emptyAuthority.size() + path.size() + 8);
  text += fileScheme;
  // A relative path has no authority before it: "file:a/b".
  if (path.starts_with('/')) text += emptyAuthority;
  appendPathEncoded(text, path);
  return URL(std::move(text));
}

std::optional<URL> URL::fileURLWithAbsoluteString(std::string_view text) {
  if (!text.starts_with(fileScheme)) return std::nullopt;
  std::string_view rest = text.substr(fileScheme.size());
  if (rest.starts_with("///")) rest.remove_prefix(emptyAuthority.size());
  const std::string path = percentDecoded(rest);
  // No system has paths with a zero byte.
  if (path.find('\0') != std::string::npos) return std::nullopt;
  URL url = fileURLWithPath(path);
  if (url.absoluteString() != text) return std::nullopt;
  return url;
}

std::string_view URL::encodedPath() const {
  std::string_view rest = text_;
  rest.remove_prefix(fileScheme.size());
  if (rest.starts_with("///")) rest.remove_prefix(emptyAuthority.size());
  return rest;
}

std::string URL::path() const {
  return percentDecoded(withoutTrailingSlash(encodedPath()));
}

bool URL::hasDirectoryPath() const {
  return encodedPath().ends_with('/');
}

std::string URL::lastPathComponent() const {
  const std::string whole = path();
  if (whole == "/") return whole;
  return whole.substr(whole.rfind('/') + 1);
}

std::string URL::pathExtension() const {
  const std::string name = lastPathComponent();
  const std::size_t dot = name.rfind('.');
  if (dot == std::string::npos || dot == 0 || dot + 1 == name.size()) return {};
  std::string extension = name.substr(dot + 1);
  if (extension.find(' ') != std::string::npos) return {};
  return extension;
}

void URL::setTemporaryResourceValue(std::string_view key, std::any value) {
  auto values = temporaryValues_ ? std::make_shared<ResourceValues>(*temporaryValues_)
                                 : std::make_shared<ResourceValues>();
  (*values)[std::string(key)] = std::move(value);
  temporaryValues_ = std::move(values);
}

std::any URL::temporaryResourceValue(std::string_view key) const {
  if (!temporaryValues_) return {};
  const auto found = temporaryValues_->find(key);
  return found == temporaryValues_->end() ? std::any() : found->second;
}

}  // namespace Varnel::Platform
