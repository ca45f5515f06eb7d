// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <string>
#include <string_view>

#include <Varnel/Platform/Api.h>

namespace Varnel::Platform {

/// The parts of a URL's text as views into it, still percent-encoded and without the marks between
/// them. Absent and empty differ: "/a?" has an empty query, "/a" none.
///
///     const auto parts = URLComponents::split("https://[::1]:8080/a?lang=de#top");
///     parts.host;   // "[::1]"
///     parts.query;  // "lang=de"
///
/// The views live as long as the text. Any text splits; whether the parts are well-formed is for
/// `URL::parse` to say.
struct VARNEL_API URLComponents final {
  std::optional<std::string_view> scheme;
  std::optional<std::string_view> user;  ///< All before the "@", a password included.
  std::optional<std::string_view> host;  ///< With its brackets; present when there is an authority.
  std::optional<std::string_view> port;
  std::string_view path;
  std::optional<std::string_view> query;
  std::optional<std::string_view> fragment;

  [[nodiscard]] static URLComponents split(std::string_view text);

  /// The text of the parts. Where the text would be split differently (a path that begins with "//"
  /// and no host before it), "/." or "./" goes before the path.
  [[nodiscard]] std::string text() const;

  /// The text of the URL that this reference means relative to `base` (RFC 3986, section 5.2). A
  /// reference with a scheme stays as it is.
  [[nodiscard]] std::string textResolvedAgainst(const URLComponents& base) const;
};

}  // namespace Varnel::Platform
