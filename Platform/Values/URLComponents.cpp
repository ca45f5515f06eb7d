// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Values/URLComponents.h>

namespace Varnel::Platform {
namespace {

// Cuts `text` at the first `mark`; what follows the mark is the answer.
std::optional<std::string_view> cutTail(std::string_view& text, char mark) {
  const std::size_t position = text.find(mark);
  if (position == std::string_view::npos) return std::nullopt;
  const std::string_view tail = text.substr(position + 1);
  text = text.substr(0, position);
  return tail;
}

void splitAuthority(std::string_view authority, URLComponents& parts) {
  if (const std::size_t at = authority.rfind('@'); at != std::string_view::npos) {
    parts.user = authority.substr(0, at);
    authority.remove_prefix(at + 1);
  }
  // The colons of an address in brackets are its own.
  const std::size_t bracket = authority.rfind(']');
  const std::size_t colon = authority.find(':', bracket == std::string_view::npos ? 0 : bracket);
  if (colon != std::string_view::npos) {
    parts.port = authority.substr(colon + 1);
    authority = authority.substr(0, colon);
  }
  parts.host = authority;
}

void dropLastSegment(std::string& path) {
  const std::size_t slash = path.rfind('/');
  path.resize(slash == std::string::npos ? 0 : slash);
}

// RFC 3986, section 5.2.4.
std::string withoutDotSegments(std::string_view path) {
  std::string out;
  out.reserve(path.size());
  while (!path.empty()) {
    if (path.starts_with("../")) {
      path.remove_prefix(3);
    } else if (path.starts_with("./")) {
      path.remove_prefix(2);
    } else if (path.starts_with("/./")) {
      path.remove_prefix(2);
    } else if (path == "/.") {
      path = "/";
    } else if (path.starts_with("/../")) {
      path.remove_prefix(3);
      dropLastSegment(out);
    } else if (path == "/..") {
      path = "/";
      dropLastSegment(out);
    } else if (path == "." || path == "..") {
      path = {};
    } else {
      const std::size_t end = path.find('/', 1);
      out.append(path.substr(0, end));
      path = end == std::string_view::npos ? std::string_view() : path.substr(end);
    }
  }
  return out;
}

std::string mergedPath(const URLComponents& base, std::string_view reference) {
  const bool isBareHost = base.host && base.path.empty();
  // Without a slash, `rfind` plus one is 0.
  std::string merged(isBareHost ? "/" : base.path.substr(0, base.path.rfind('/') + 1));
  return merged += reference;
}

// The text to put before a path whose beginning would otherwise read as a host or a scheme.
std::string_view guardOf(const URLComponents& parts) {
  if (parts.host) return {};
  if (parts.path.starts_with("//")) return "/.";
  if (!parts.scheme && parts.path.substr(0, parts.path.find('/')).find(':') != std::string::npos)
    return "./";
  return {};
}

}  // namespace

URLComponents URLComponents::split(std::string_view text) {
  URLComponents parts;
  parts.fragment = cutTail(text, '#');
  parts.query = cutTail(text, '?');
  const std::size_t mark = text.find_first_of(":/");
  if (mark != std::string_view::npos && text[mark] == ':') {
    parts.scheme = text.substr(0, mark);
    text.remove_prefix(mark + 1);
  }
  if (text.starts_with("//")) {
    text.remove_prefix(2);
    const std::size_t end = text.find('/');
    splitAuthority(text.substr(0, end), parts);
    text = end == std::string_view::npos ? std::string_view() : text.substr(end);
  }
  parts.path = text;
  return parts;
}

std::string URLComponents::text() const {
  const auto size = [](const std::optional<std::string_view>& part) {
    return part ? part->size() + 2 : 0;
  };
  std::string out;
  out.reserve(size(scheme) + size(user) + size(host) + size(port) + path.size() + size(query) +
              size(fragment) + 2);
  if (scheme) (out += *scheme) += ':';
  if (host) {
    out += "//";
    if (user) (out += *user) += '@';
    out += *host;
    if (port) (out += ':') += *port;
  }
  (out += guardOf(*this)) += path;
  if (query) (out += '?') += *query;
  if (fragment) (out += '#') += *fragment;
  return out;
}

std::string URLComponents::textResolvedAgainst(const URLComponents& base) const {
  if (scheme) return text();
  URLComponents target = *this;
  target.scheme = base.scheme;
  std::string newPath;
  if (host) {
    newPath = withoutDotSegments(path);
  } else {
    target.user = base.user;
    target.host = base.host;
    target.port = base.port;
    if (path.empty()) {
      newPath = base.path;
      if (!query) target.query = base.query;
    } else {
      newPath =
          withoutDotSegments(path.starts_with('/') ? std::string(path) : mergedPath(base, path));
    }
  }
  target.path = newPath;
  return target.text();
}

}  // namespace Varnel::Platform
