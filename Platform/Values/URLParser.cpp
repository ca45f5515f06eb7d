// SPDX-License-Identifier: MIT
#include <algorithm>

#include <Varnel/Platform/Values/PercentEncoding.h>
#include <Varnel/Platform/Values/URL.h>

namespace Varnel::Platform {
namespace {

// RFC 3986, sections 3.2.1, 3.2.2, 3.4 and 3.5.
constexpr ByteSet userBytes = alphanumericAnd("-._~!$&'()*+,;=:");
constexpr ByteSet nameBytes = alphanumericAnd("-._~!$&'()*+,;=");
constexpr ByteSet queryBytes = alphanumericAnd("-._~!$&'()*+,;=:@/?");
constexpr ByteSet schemeBytes = alphanumericAnd("+-.");
constexpr ByteSet addressBytes = alphanumericAnd("-._~!$&'()*+,;=:%");

bool consistsOf(std::string_view text, const ByteSet& set) {
  return std::all_of(text.begin(), text.end(), [&](char c) { return contains(set, c); });
}

bool isDigit(char c) {
  return c >= '0' && c <= '9';
}

bool isHexDigit(char c) {
  return isDigit(c) || (c >= 'a' && c <= 'f') || (c >= 'A' && c <= 'F');
}

bool isScheme(std::string_view text) {
  return !text.empty() && !isDigit(text[0]) && contains(alphanumericAnd(""), text[0]) &&
         consistsOf(text, schemeBytes);
}

// "[::1]", "[fe80::1%25eth0]" or an address of a version to come, "[v7.x]".
bool isBracketedAddress(std::string_view host) {
  if (!host.starts_with('[') || !host.ends_with(']')) return false;
  const std::string_view address = host.substr(1, host.size() - 2);
  if (!consistsOf(address, addressBytes)) return false;
  if (address.starts_with('v') || address.starts_with('V')) {
    const std::size_t dot = address.find('.');
    return dot != std::string_view::npos && dot > 1 && dot + 1 < address.size();
  }
  const std::string_view number = address.substr(0, address.find('%'));
  if (number.size() < address.size() && !address.substr(number.size()).starts_with("%25"))
    return false;
  return std::count(number.begin(), number.end(), ':') >= 2 &&
         std::all_of(number.begin(), number.end(),
                     [](char c) { return isHexDigit(c) || c == ':' || c == '.'; });
}

// A name in another script has its bytes encoded. A name with blanks or brackets is refused.
bool isHostName(std::string_view host) {
  return std::all_of(host.begin(), host.end(), [](char c) {
    return contains(nameBytes, c) || c == '%' || static_cast<unsigned char>(c) >= 0x80;
  });
}

bool isPort(std::string_view port) {
  constexpr std::size_t maxDigits = 5;
  if (port.size() > maxDigits || !std::all_of(port.begin(), port.end(), isDigit)) return false;
  int number = 0;
  for (const char c : port) number = number * 10 + (c - '0');
  return number <= 65535;
}

bool isWellFormed(const URLComponents& parts) {
  if (parts.scheme && !isScheme(*parts.scheme)) return false;
  if (parts.user && parts.user->find_first_of("@[]") != std::string_view::npos) return false;
  if (parts.port && !isPort(*parts.port)) return false;
  return !parts.host || isHostName(*parts.host) || isBracketedAddress(*parts.host);
}

// The text with each byte that may not stand in its place encoded.
std::string repaired(const URLComponents& parts, std::size_t size) {
  std::string out;
  out.reserve(size + 16);
  if (parts.scheme) (out += *parts.scheme) += ':';
  if (parts.host) {
    out += "//";
    if (parts.user) {
      appendPercentRepaired(out, *parts.user, userBytes);
      out += '@';
    }
    if (parts.host->starts_with('['))
      out += *parts.host;
    else
      appendPercentRepaired(out, *parts.host, nameBytes);
    if (parts.port) (out += ':') += *parts.port;
  }
  appendPercentRepaired(out, parts.path, pathBytes);
  if (parts.query) appendPercentRepaired(out += '?', *parts.query, queryBytes);
  if (parts.fragment) appendPercentRepaired(out += '#', *parts.fragment, queryBytes);
  return out;
}

}  // namespace

std::optional<URL> URL::parse(std::string_view text) {
  if (text.empty()) return std::nullopt;
  const URLComponents parts = URLComponents::split(text);
  if (!isWellFormed(parts)) return std::nullopt;
  return URL(repaired(parts, text.size()));
}

std::optional<URL> URL::parse(std::string_view text, const URL& base) {
  const URLComponents parts = URLComponents::split(text);
  if (!isWellFormed(parts)) return std::nullopt;
  const std::string reference = repaired(parts, text.size());
  return URL(URLComponents::split(reference).textResolvedAgainst(base.components()));
}

std::optional<URL> URL::withParts(std::string_view scheme, std::string_view host,
                                  std::string_view path, std::string_view encodedQuery) {
  if (host.empty() || (!path.empty() && !path.starts_with('/'))) return std::nullopt;
  // A "%" or a "?" of a path is the path's own here.
  std::string encodedPath;
  appendPercentEncoded(encodedPath, path, pathBytes);
  URLComponents parts;
  parts.scheme = scheme;
  parts.host = host;
  parts.path = encodedPath;
  if (!encodedQuery.empty()) parts.query = encodedQuery;
  if (!isWellFormed(parts)) return std::nullopt;
  return URL(repaired(parts, parts.host->size() + encodedPath.size() + encodedQuery.size()));
}

URL URL::withQuery(std::string_view encodedQuery) const {
  std::string query;
  appendPercentRepaired(query, encodedQuery, queryBytes);
  URLComponents parts = components();
  parts.query = query;
  return URL(parts.text());
}

}  // namespace Varnel::Platform
