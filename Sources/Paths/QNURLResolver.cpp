// SPDX-License-Identifier: MIT
#include <Varnel/Paths/QNURLResolver.h>

#include <algorithm>

#include <Basalt/FileURLs.h>
#include <Platform/Ports/Ports.h>
#include <Platform/Text/KeyedArchive.h>

namespace Varnel {
namespace {

using Platform::PathComponents;
using Platform::PathReader;
using Platform::URL;

constexpr std::string_view homeSign = "~";
constexpr std::string_view rootSign = "/";
constexpr std::string_view homeKey = "homeURL";
constexpr std::string_view rootKey = "rootURL";

void dropTrailingSlash(PathComponents& components) {
  if (components.size() > 1 && components.back() == "/") components.pop_back();
}

void append(std::string& path, PathReader rest) {
  while (!rest.atEnd()) Platform::appendPathComponent(path, rest.next());
}

// Paths are abbreviated by the thousand, so a text is never taken apart: this is
// abbreviateComponents and the joining of its result in one walk. False, and nothing appended,
// when the path does not start with the base.
bool appendAbbreviated(std::string& text, PathReader path, const PathComponents& baseComponents,
                       std::string_view sign) {
  for (const std::string& component : baseComponents)
    if (path.atEnd() || path.next() != component) return false;
  text += sign;
  append(text, path);
  return true;
}

std::string markedAsFolder(std::string path, bool isDirectory) {
  if (isDirectory && path != homeSign && path != rootSign) path += '/';
  return path;
}

}  // namespace

QNURLResolver::QNURLResolver(const URL& homeURL, const URL& rootURL)
    : bases_(std::make_shared<const Bases>(Bases{
          .homeURL = homeURL,
          .rootURL = rootURL,
          .homeComponents = Platform::pathComponents(homeURL),
          .rootComponents = Platform::pathComponents(rootURL),
      })) {}

const QNURLResolver& QNURLResolver::shared() {
  static const QNURLResolver& resolver = *new QNURLResolver(
      Basalt::realHome(Platform::processPorts().userAccount), URL::fileURLWithPath("/"));
  return resolver;
}

std::optional<QNURLResolver> QNURLResolver::decode(const Platform::KeyedUnarchiver& coder) {
  const auto homeURL = coder.decodeURL(homeKey);
  const auto rootURL = coder.decodeURL(rootKey);
  if (!homeURL || !rootURL) return std::nullopt;
  return QNURLResolver(*homeURL, *rootURL);
}

void QNURLResolver::encode(Platform::KeyedArchiver& coder) const {
  coder.encode(std::string(homeKey), homeURL());
  coder.encode(std::string(rootKey), rootURL());
}

std::optional<PathComponents> QNURLResolver::expandedPathComponentsForPath(
    std::string_view path) const {
  if (path.empty()) return std::nullopt;
  PathComponents components = Platform::pathComponents(path);
  const bool isBelowHome = components.front() == homeSign;
  if (!isBelowHome && components.front() != rootSign) return components;
  dropTrailingSlash(components);
  PathComponents expanded = isBelowHome ? homeURLPathComponents() : rootURLPathComponents();
  expanded.insert(expanded.end(), components.begin() + 1, components.end());
  return expanded;
}

std::optional<std::string> QNURLResolver::expandedPathForPath(std::string_view path) const {
  const auto components = expandedPathComponentsForPath(path);
  if (!components || components->empty()) return std::nullopt;
  return Platform::joinPathComponents(*components);
}

std::optional<URL> QNURLResolver::fileURLWithPath(std::string_view path) const {
  if (path == homeSign) return homeURL();
  if (path == rootSign) return rootURL();
  const auto components = expandedPathComponentsForPath(path);
  if (!components) return std::nullopt;
  return URL::fileURLWithPath(Platform::joinPathComponents(*components));
}

std::optional<std::string> QNURLResolver::abbreviatedPathForURL(
    const URL& url, std::optional<bool> isDirectory) const {
  return abbreviatedPathForComponents(Platform::pathComponents(url),
                                      isDirectory.value_or(false) || Basalt::isDirectory(url));
}

std::optional<std::string> QNURLResolver::abbreviatedPathForComponents(
    const PathComponents& components, bool isDirectory) const {
  if (components.empty()) return std::nullopt;
  return markedAsFolder(Platform::joinPathComponents(abbreviatedPathComponents(components)),
                        isDirectory);
}

std::string QNURLResolver::abbreviatedPath(std::string_view path, bool isDirectory) const {
  if (path.empty()) return {};
  std::string text;
  text.reserve(path.size() + 2);
  const PathReader reader(path);
  if (!appendAbbreviated(text, reader, homeURLPathComponents(), homeSign) &&
      !appendAbbreviated(text, reader, rootURLPathComponents(), rootSign))
    append(text, reader);
  return markedAsFolder(std::move(text), isDirectory);
}

std::string QNURLResolver::abbreviatedPath(std::string_view path) const {
  return abbreviatedPath(path, path.ends_with('/'));
}

PathComponents QNURLResolver::abbreviatedPathComponents(const PathComponents& components) const {
  if (auto short_ = abbreviateComponents(components, homeURLPathComponents(), homeSign))
    return *std::move(short_);
  if (auto short_ = abbreviateComponents(components, rootURLPathComponents(), rootSign))
    return *std::move(short_);
  return components;
}

PathComponents QNURLResolver::abbreviatedPathComponentsForPath(std::string_view path) const {
  PathComponents components = Platform::pathComponents(path);
  if (components.empty()) return components;
  dropTrailingSlash(components);
  return abbreviatedPathComponents(components);
}

std::optional<PathComponents> QNURLResolver::abbreviatedPathComponentsForURL(const URL& url) const {
  const PathComponents components = Platform::pathComponents(url);
  if (components.empty()) return std::nullopt;
  return abbreviatedPathComponents(components);
}

std::optional<PathComponents> QNURLResolver::abbreviateComponents(
    const PathComponents& components, const PathComponents& baseComponents,
    std::optional<std::string_view> abbreviatedComponent) {
  if (baseComponents.size() > components.size() ||
      !std::equal(baseComponents.begin(), baseComponents.end(), components.begin()))
    return std::nullopt;
  return stripBaseFromPathComponents(components, baseComponents, abbreviatedComponent);
}

std::optional<PathComponents> QNURLResolver::abbreviatePath(std::string_view path,
                                                            const PathComponents& baseComponents) {
  return abbreviateComponents(Platform::pathComponents(path), baseComponents);
}

std::optional<PathComponents> QNURLResolver::stripBaseFromPathComponents(
    const PathComponents& components, const PathComponents& baseComponents,
    std::optional<std::string_view> abbreviatedComponent) {
  if (baseComponents.size() > components.size()) return std::nullopt;
  PathComponents rest;
  rest.reserve(components.size() - baseComponents.size() + 1);
  if (abbreviatedComponent) rest.emplace_back(*abbreviatedComponent);
  rest.insert(rest.end(), components.begin() + static_cast<std::ptrdiff_t>(baseComponents.size()),
              components.end());
  return rest;
}

std::optional<PathComponents> QNURLResolver::stripBaseFromPath(
    std::string_view path, const PathComponents& baseComponents,
    std::optional<std::string_view> abbreviatedComponent) {
  return stripBaseFromPathComponents(Platform::pathComponents(path), baseComponents,
                                     abbreviatedComponent);
}

bool QNURLResolver::operator==(const QNURLResolver& other) const {
  return homeURLPathComponents() == other.homeURLPathComponents() &&
         rootURLPathComponents() == other.rootURLPathComponents();
}

std::size_t QNURLResolver::hash() const {
  std::size_t hash = 0;
  const auto mix = [&hash](std::string_view text) {
    hash = hash * 31 + std::hash<std::string_view>()(text);
  };
  for (const std::string& component : homeURLPathComponents()) mix(component);
  mix({});
  for (const std::string& component : rootURLPathComponents()) mix(component);
  return hash;
}

}  // namespace Varnel
