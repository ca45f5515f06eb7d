// SPDX-License-Identifier: MIT
#include <Varnel/Paths/QNURLResolver.h>

#include <algorithm>
#include <utility>

#include <Varnel/Basalt/FileURLs.h>
#include <Varnel/Platform/Ports/Ports.h>
#include <Varnel/Platform/Text/KeyedArchive.h>

namespace Varnel {
namespace {

using Platform::PathComponents;
using Platform::URL;

constexpr std::string_view homeSign = "~";
constexpr std::string_view rootSign = "/";
constexpr std::string_view homeKey = "homeURL";
constexpr std::string_view rootKey = "rootURL";

void dropTrailingSlash(PathComponents& components) {
  if (components.size() > 1 && components.back() == "/") components.pop_back();
}

// Whether joining the components of the path would give the path itself.
bool isTidy(std::string_view path) {
  // Without an early exit, and with bytes, the compiler compares sixteen at once.
  unsigned char hasRun = 0;
  for (std::size_t i = 1; i < path.size(); ++i)
    hasRun |= static_cast<unsigned char>(((path[i - 1] ^ '/') | (path[i] ^ '/')) == 0);
  return hasRun == 0 && (path.size() < 2 || path.back() != '/');
}

// The part of a path after a base, when both are tidy: empty, or text from the slash on.
std::optional<std::string_view> tailBelow(std::string_view path, std::string_view basePath) {
  if (!path.starts_with(basePath)) return std::nullopt;
  if (basePath == "/") return path == "/" ? std::string_view() : path;
  const std::string_view tail = path.substr(basePath.size());
  if (!tail.empty() && tail.front() != '/') return std::nullopt;
  return tail;
}

std::string concatenated(std::string_view sign, std::string_view tail) {
  std::string path;
  path.reserve(sign.size() + tail.size() + 1);  // A folder gets a slash.
  path += sign;
  path += tail;
  return path;
}

std::string markedAsFolder(std::string path, bool isDirectory) {
  if (isDirectory && path != homeSign && path != rootSign) path += '/';
  return path;
}

}  // namespace

QNURLResolver::QNURLResolver(const URL& homeURL, const URL& rootURL) {
  PathComponents home = Platform::pathComponents(homeURL);
  PathComponents root = Platform::pathComponents(rootURL);
  std::string homePath = Platform::joinPathComponents(home);
  std::string rootPath = Platform::joinPathComponents(root);
  bases_ = std::make_shared<const Bases>(Bases{.homeURL = homeURL,
                                               .rootURL = rootURL,
                                               .homeComponents = std::move(home),
                                               .rootComponents = std::move(root),
                                               .homePath = std::move(homePath),
                                               .rootPath = std::move(rootPath)});
}

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
  if (!path.empty() && path.find_first_not_of('/') == path.npos) return rootURL();
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
  if (path.size() > 1 && path.ends_with('/')) path.remove_suffix(1);
  // Lists abbreviate paths by the thousand: mostly no component needs to be made.
  if (!isTidy(path) || bases_->homePath.empty() || bases_->rootPath.empty())
    return *abbreviatedPathForComponents(Platform::pathComponents(path), isDirectory);
  if (const auto tail = tailBelow(path, bases_->homePath))
    return markedAsFolder(concatenated(homeSign, *tail), isDirectory);
  const auto tail = tailBelow(path, bases_->rootPath);
  return markedAsFolder(
      tail && tail->empty() ? std::string(rootSign) : concatenated({}, tail.value_or(path)),
      isDirectory);
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
