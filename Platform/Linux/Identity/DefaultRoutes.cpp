// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Linux/Identity/DefaultRoutes.h>

#include <algorithm>
#include <charconv>
#include <cstdint>
#include <optional>

namespace Varnel::Platform::Linux {
namespace {

struct Route {
  std::uint32_t metric;
  std::string interface;
};

using Fields = std::vector<std::string_view>;

Fields split(std::string_view line) {
  constexpr std::string_view blanks = " \t\r";
  Fields fields;
  while (true) {
    const std::size_t start = line.find_first_not_of(blanks);
    if (start == std::string_view::npos) return fields;
    line.remove_prefix(start);
    const std::size_t end = std::min(line.find_first_of(blanks), line.size());
    fields.push_back(line.substr(0, end));
    line.remove_prefix(end);
  }
}

std::optional<std::uint32_t> number(std::string_view digits, int base) {
  std::uint32_t value = 0;
  const char* const end = digits.data() + digits.size();
  const auto [stop, status] = std::from_chars(digits.data(), end, value, base);
  if (status != std::errc() || stop != end) return std::nullopt;
  return value;
}

bool isZero(std::string_view digits) {
  return digits.find_first_not_of('0') == std::string_view::npos;
}

// Whether a route is up and does not refuse its packets.
bool isUsable(std::optional<std::uint32_t> flags) {
  constexpr std::uint32_t up = 0x0001;
  constexpr std::uint32_t rejecting = 0x0200;
  return flags && (*flags & up) && !(*flags & rejecting);
}

// Iface Destination Gateway Flags RefCnt Use Metric Mask …
std::optional<Route> defaultRouteOfIPv4(const Fields& fields) {
  if (fields.size() < 8 || !isZero(fields[1]) || !isZero(fields[7])) return std::nullopt;
  const auto metric = number(fields[6], 10);
  if (!metric || !isUsable(number(fields[3], 16))) return std::nullopt;
  return Route{*metric, std::string(fields[0])};
}

// destination length source length gateway metric references uses flags interface
std::optional<Route> defaultRouteOfIPv6(const Fields& fields) {
  if (fields.size() < 10) return std::nullopt;
  if (!std::all_of(fields.begin(), fields.begin() + 4, isZero)) return std::nullopt;
  const auto metric = number(fields[5], 16);
  if (!metric || !isUsable(number(fields[8], 16))) return std::nullopt;
  return Route{*metric, std::string(fields[9])};
}

template <typename Parse>
void appendRoutes(std::vector<Route>& routes, std::string_view table, Parse parse) {
  while (!table.empty()) {
    const std::size_t end = std::min(table.find('\n'), table.size());
    if (auto route = parse(split(table.substr(0, end)))) routes.push_back(std::move(*route));
    table.remove_prefix(std::min(end + 1, table.size()));
  }
}

}  // namespace

std::vector<std::string> interfacesOfDefaultRoutes(std::string_view ipv4Table,
                                                   std::string_view ipv6Table) {
  std::vector<Route> routes;
  appendRoutes(routes, ipv4Table, defaultRouteOfIPv4);
  appendRoutes(routes, ipv6Table, defaultRouteOfIPv6);
  std::stable_sort(routes.begin(), routes.end(),
                   [](const Route& a, const Route& b) { return a.metric < b.metric; });
  std::vector<std::string> interfaces;
  interfaces.reserve(routes.size());
  for (Route& route : routes) interfaces.push_back(std::move(route.interface));
  return interfaces;
}

}  // namespace Varnel::Platform::Linux
