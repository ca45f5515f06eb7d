// SPDX-License-Identifier: MIT
#pragma once

#include <any>
#include <cstddef>
#include <functional>
#include <map>
#include <memory>
#include <optional>
#include <string>
#include <string_view>

#include <Varnel/Platform/Api.h>
#include <Varnel/Platform/Values/URLComponents.h>

namespace Varnel::Platform {

/// The location of a file, folder or page, in the form of RFC 3986 and RFC 8089
/// ("file:///home/u/a%20b").
///
///     const URL folder = URL::fileURLWithPath("/home/u/Pictures/");
///     folder.path();              // "/home/u/Pictures"
///     folder.hasDirectoryPath();  // true
///     const auto page = URL::parse("https://quennel.example/über uns?lang=de");
///     page->absoluteString();     // "https://quennel.example/%C3%BCber%20uns?lang=de"
///
/// A path is a run of bytes, as the system sees it: every byte comes back from `path()` as it went
/// in, valid UTF-8 or not. Nothing here asks the file system. An immutable value, except for its
/// temporary resource values; two URLs are equal when their texts are.
class VARNEL_API URL final {
 public:
  /// The URL of a file system path. A trailing "/" marks a folder. A relative path stays relative.
  [[nodiscard]] static URL fileURLWithPath(std::string_view path);

  /// The file URL whose `absoluteString()` is `text`; absent when no file URL has this text.
  [[nodiscard]] static std::optional<URL> fileURLWithAbsoluteString(std::string_view text);

  /// The URL that `text` means. Valid bytes and escapes stay as they are; a byte that may not stand
  /// where it does is percent-encoded. Absent when the text is empty or does not have the structure
  /// of a URL: a malformed scheme, host or port, or a first path component that looks like a
  /// scheme.
  [[nodiscard]] static std::optional<URL> parse(std::string_view text);

  /// The same for a text that may be relative to `base`; the answer is the URL that the two make.
  [[nodiscard]] static std::optional<URL> parse(std::string_view text, const URL& base);

  /// The URL of a page from its parts: the path decoded, the query encoded and left out when
  /// empty. Absent when they make no URL; a path that is not empty begins with "/".
  [[nodiscard]] static std::optional<URL> withParts(std::string_view scheme, std::string_view host,
                                                    std::string_view path,
                                                    std::string_view encodedQuery);

  /// This URL with another query. All else stays byte for byte.
  [[nodiscard]] URL withQuery(std::string_view encodedQuery) const;

  /// The parts of the text. They live as long as this object.
  [[nodiscard]] URLComponents components() const { return URLComponents::split(text_); }

  /// Whether the URL has this scheme, or host, in whichever case its letters are.
  [[nodiscard]] bool hasScheme(std::string_view scheme) const;
  [[nodiscard]] bool hasHost(std::string_view host) const;

  /// The whole text, percent-encoded.
  [[nodiscard]] const std::string& absoluteString() const { return text_; }

  /// The path, decoded, without the trailing "/" of a folder ("/" itself stays).
  [[nodiscard]] std::string path() const;

  /// Whether the path ends with "/".
  [[nodiscard]] bool hasDirectoryPath() const;

  /// The last component of the path, "/" for the root, empty for an empty path.
  [[nodiscard]] std::string lastPathComponent() const;

  /// What follows the last "." of the last component; empty without one. A leading dot starts a
  /// name, not an extension, and an extension holds no space.
  [[nodiscard]] std::string pathExtension() const;

  /// Attaches a value to this URL and to its copies made afterwards; it is never written to disk
  /// and has no part in equality. Not to be called while other threads read this object.
  void setTemporaryResourceValue(std::string_view key, std::any value);

  /// The value attached under `key`; an empty `any` when there is none.
  [[nodiscard]] std::any temporaryResourceValue(std::string_view key) const;

  bool operator==(const URL& other) const { return text_ == other.text_; }
  auto operator<=>(const URL& other) const { return text_ <=> other.text_; }

 private:
  using ResourceValues = std::map<std::string, std::any, std::less<>>;

  explicit URL(std::string text) : text_(std::move(text)) {}
  [[nodiscard]] std::string_view encodedPath() const { return components().path; }

  std::string text_;
  std::shared_ptr<const ResourceValues> temporaryValues_;
};

}  // namespace Varnel::Platform

template <>
struct std::hash<Varnel::Platform::URL> {
  std::size_t operator()(const Varnel::Platform::URL& url) const noexcept {
    return std::hash<std::string>{}(url.absoluteString());
  }
};
