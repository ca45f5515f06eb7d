// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Linux/Identity/NetworkInterfaces.h>

#include <algorithm>
#include <charconv>
#include <set>

namespace Varnel::Platform::Linux {
namespace {

bool isFileName(const std::string& name) {
  return !name.empty() && name != "." && name != ".." && name.find('/') == std::string::npos;
}

// "52:54:00:12:34:56"
std::optional<PropertyData> parseAddress(std::string_view text) {
  PropertyData bytes;
  while (true) {
    unsigned byte = 0;
    if (text.size() < 2) return std::nullopt;
    const auto [stop, status] = std::from_chars(text.data(), text.data() + 2, byte, 16);
    if (status != std::errc() || stop != text.data() + 2) return std::nullopt;
    bytes.push_back(static_cast<std::byte>(byte));
    text.remove_prefix(2);
    if (text.empty()) return bytes;
    if (text.front() != ':') return std::nullopt;
    text.remove_prefix(1);
  }
}

bool isNothing(const PropertyData& address) {
  return std::all_of(address.begin(), address.end(), [](std::byte b) { return b == std::byte{}; });
}

}  // namespace

NetworkInterfaces::NetworkInterfaces(const std::string& folder) : folder_(folder.c_str()) {}

bool NetworkInterfaces::isPhysicalEthernet(const std::string& name) const {
  return folder_.contains(name + "/device") &&
         trimmed(folder_.bytes(name + "/type").value_or("")) == "1";
}

std::vector<std::string> NetworkInterfaces::lowerInterfaces(const std::string& name) const {
  constexpr std::string_view prefix = "lower_";
  std::vector<std::string> names;
  for (const std::string& file : folder_.names(name))
    if (file.starts_with(prefix)) names.push_back(file.substr(prefix.size()));
  return names;
}

std::optional<std::string> NetworkInterfaces::physicalInterface(
    const std::vector<std::string>& names) const {
  // Depth first: the interfaces below a route's interface come before the next route.
  std::vector<std::string> waiting(names.rbegin(), names.rend());
  std::set<std::string> seen;
  while (!waiting.empty()) {
    const std::string name = std::move(waiting.back());
    waiting.pop_back();
    if (!isFileName(name) || !seen.insert(name).second) continue;
    if (isPhysicalEthernet(name)) return name;
    const auto lower = lowerInterfaces(name);
    waiting.insert(waiting.end(), lower.rbegin(), lower.rend());
  }
  return std::nullopt;
}

std::optional<PropertyData> NetworkInterfaces::hardwareAddress(const std::string& name) const {
  // Members of a bond all show its address.
  for (const char* file : {"/bonding_slave/perm_hwaddr", "/address"}) {
    const auto text = folder_.bytes(name + file);
    auto address = text ? parseAddress(trimmed(*text)) : std::nullopt;
    if (address && !isNothing(*address)) return address;
  }
  return std::nullopt;
}

}  // namespace Varnel::Platform::Linux
