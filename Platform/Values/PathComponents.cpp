// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Values/PathComponents.h>

#include <algorithm>

namespace Varnel::Platform {

std::string_view PathReader::next() {
  const std::size_t start = position_;
  if (path_[start] == '/') {
    position_ = std::min(path_.find_first_not_of('/', start), path_.size());
    // Slashes between two names only separate them; at either end they are a component.
    if (start == 0 || atEnd()) return path_.substr(start, 1);
    return next();
  }
  position_ = std::min(path_.find('/', start), path_.size());
  return path_.substr(start, position_ - start);
}

PathComponents pathComponents(std::string_view path) {
  PathComponents components;
  for (PathReader reader(path); !reader.atEnd();) components.emplace_back(reader.next());
  return components;
}

PathComponents pathComponents(const URL& url) {
  PathComponents components = pathComponents(url.path());
  if (components.size() > 1 && components.back() == "/") components.pop_back();
  return components;
}

std::string joinPathComponents(const PathComponents& components) {
  std::string path;
  for (const std::string& component : components) appendPathComponent(path, component);
  return path;
}

void appendPathComponent(std::string& path, std::string_view component) {
  // A component may itself hold slashes.
  for (PathReader reader(component); !reader.atEnd();) {
    const std::string_view name = reader.next();
    if (path.empty()) {
      path = name;
    } else if (name != "/") {
      if (path.back() != '/') path += '/';
      path += name;
    }
  }
}

std::string fileNameFor(std::string text) {
  for (char& character : text)
    if (character == '/' || character == '\0') character = '_';
  if (text.empty() || text == "." || text == "..") return "_";
  return text;
}

}  // namespace Varnel::Platform
