// SPDX-License-Identifier: MIT
#pragma once

#include <cstddef>
#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <string_view>

#include <Varnel/Platform/Api.h>
#include <Varnel/Platform/Values/PathComponents.h>
#include <Varnel/Platform/Values/URL.h>

namespace Varnel::Platform {
class KeyedArchiver;
class KeyedUnarchiver;
}  // namespace Varnel::Platform

namespace Varnel {

/// Turns absolute paths into short forms for people, and short forms back into full paths:
///
///     const QNURLResolver& resolver = QNURLResolver::shared();
///     resolver.abbreviatedPath("/home/ann/Documents/");   // "~/Documents/"
///     resolver.expandedPathForPath("~/Documents/");       // "/home/ann/Documents"
///
/// There are two bases: short forms below the home URL start with "~", those below the root URL
/// with "/". Components are compared byte for byte. An immutable value: copies share one state, and
/// two are equal when the components of their bases are. Any thread. Only `abbreviatedPathForURL`
/// may look into the file system.
class VARNEL_API QNURLResolver final {
 public:
  using PathComponents = Platform::PathComponents;
  using URL = Platform::URL;

  QNURLResolver(const URL& homeURL, const URL& rootURL);
  QNURLResolver(const QNURLResolver&) = default;
  QNURLResolver& operator=(const QNURLResolver&) = default;

  /// The process's resolver: the user's real home folder and the root of the file system.
  [[nodiscard]] static const QNURLResolver& shared();

  /// The resolver that was encoded; absent when the archive lacks one of the two file URLs.
  [[nodiscard]] static std::optional<QNURLResolver> decode(const Platform::KeyedUnarchiver& coder);
  /// Archives both URLs, under the keys "homeURL" and "rootURL".
  void encode(Platform::KeyedArchiver& coder) const;

  [[nodiscard]] const URL& homeURL() const { return bases_->homeURL; }
  [[nodiscard]] const URL& rootURL() const { return bases_->rootURL; }
  [[nodiscard]] const PathComponents& homeURLPathComponents() const {
    return bases_->homeComponents;
  }
  [[nodiscard]] const PathComponents& rootURLPathComponents() const {
    return bases_->rootComponents;
  }

  /// Full paths. "~" and "/" at the start stand for the bases; a path that starts otherwise is
  /// relative and stays so. Absent for an empty text. A trailing slash is dropped.
  [[nodiscard]] std::optional<PathComponents> expandedPathComponentsForPath(
      std::string_view path) const;
  [[nodiscard]] std::optional<std::string> expandedPathForPath(std::string_view path) const;
  /// "~" gives `homeURL()` itself, "/" gives `rootURL()` itself.
  [[nodiscard]] std::optional<URL> fileURLWithPath(std::string_view path) const;

  /// Short forms. A folder's ends with "/", but for "~" and "/" themselves. Without the hint, or
  /// with a false one, a URL without trailing slash is looked up in the file system. Absent only
  /// for a URL or a list without components.
  [[nodiscard]] std::optional<std::string> abbreviatedPathForURL(
      const URL& url, std::optional<bool> isDirectory = std::nullopt) const;
  [[nodiscard]] std::optional<std::string> abbreviatedPathForComponents(
      const PathComponents& components, bool isDirectory) const;
  [[nodiscard]] std::string abbreviatedPath(std::string_view path, bool isDirectory) const;
  /// A folder's path is told by its trailing slash.
  [[nodiscard]] std::string abbreviatedPath(std::string_view path) const;

  /// Short forms as components; those below no base are returned unchanged.
  [[nodiscard]] PathComponents abbreviatedPathComponents(const PathComponents& components) const;
  [[nodiscard]] PathComponents abbreviatedPathComponentsForPath(std::string_view path) const;
  [[nodiscard]] std::optional<PathComponents> abbreviatedPathComponentsForURL(const URL& url) const;

  /// The path below the base, led by `abbreviatedComponent` if there is one; absent when the path
  /// does not start with the base. A base without components matches every path.
  [[nodiscard]] static std::optional<PathComponents> abbreviateComponents(
      const PathComponents& components, const PathComponents& baseComponents,
      std::optional<std::string_view> abbreviatedComponent = std::nullopt);
  [[nodiscard]] static std::optional<PathComponents> abbreviatePath(
      std::string_view path, const PathComponents& baseComponents);

  /// The same without comparing: as many components as the base has are taken off. Absent when
  /// the path has fewer.
  [[nodiscard]] static std::optional<PathComponents> stripBaseFromPathComponents(
      const PathComponents& components, const PathComponents& baseComponents,
      std::optional<std::string_view> abbreviatedComponent = std::nullopt);
  [[nodiscard]] static std::optional<PathComponents> stripBaseFromPath(
      std::string_view path, const PathComponents& baseComponents,
      std::optional<std::string_view> abbreviatedComponent = std::nullopt);

  bool operator==(const QNURLResolver& other) const;

  /// Agrees with equality.
  [[nodiscard]] std::size_t hash() const;

 private:
  struct Bases {
    URL homeURL;
    URL rootURL;
    PathComponents homeComponents;
    PathComponents rootComponents;
    std::string homePath;
    std::string rootPath;
  };

  std::shared_ptr<const Bases> bases_;
};

}  // namespace Varnel

template <>
struct std::hash<Varnel::QNURLResolver> {
  std::size_t operator()(const Varnel::QNURLResolver& resolver) const { return resolver.hash(); }
};
