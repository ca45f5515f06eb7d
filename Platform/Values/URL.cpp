// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Values/URL.h>

#include <algorithm>

#include <Varnel/Platform/Values/PercentEncoding.h>

namespace Varnel::Platform {
namespace {

constexpr std::string_view fileScheme = "file:";
constexpr std::string_view emptyAuthority = "//";

std::string_view withoutTrailingSlash(std::string_view path) {
  while (path.size() > 1 && path.back() == '/') path.remove_suffix(1);
  return path;
}

char lowerCase(char c) {
  return c >= 'A' && c <= 'Z' ? static_cast<char>(c - 'A' + 'a') : c;
}

bool areEqualInAnyCase(std::string_view left, std::string_view right) {
  return std::equal(left.begin(), left.end(), right.begin(), right.end(),
                    [](char a, char b) { return lowerCase(a) == lowerCase(b); });
}

}  // namespace

URL URL::fileURLWithPath(std::string_view path) {
  std::string text;
  text.reserve(fileScheme.size() + emptyAuthority.size() + path.size() + 8);
  text += fileScheme;
  // A relative path has no authority before it: "file:a/b".
  if (path.starts_with('/')) text += emptyAuthority;
  appendPercentEncoded(text, path, pathBytes);
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

bool URL::hasScheme(std::string_view scheme) const {
  const auto own = components().scheme;
  return own && areEqualInAnyCase(*own, scheme);
}

bool URL::hasHost(std::string_view host) const {
  const auto own = components().host;
  return own && areEqualInAnyCase(*own, host);
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
