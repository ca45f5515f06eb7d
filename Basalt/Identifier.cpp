// SPDX-License-Identifier: MIT
#include <Varnel/Basalt/Identifier.h>

namespace Basalt {

std::string identifier(std::string_view base, std::string_view component) {
  if (base.empty() || component.empty()) return {};
  std::string joined(base);
  joined += '.';
  joined += component;
  return joined;
}

std::string withoutChannelComponent(std::string_view bundleIdentifier) {
  std::size_t start = 0;
  for (std::size_t end = 0; (end = bundleIdentifier.find('.', start)) != std::string_view::npos;
       start = end + 1) {
    const std::string_view component = bundleIdentifier.substr(start, end - start);
    if (component != "site" && component != "trial") continue;
    std::string base(bundleIdentifier.substr(0, start));
    base += bundleIdentifier.substr(end + 1);
    return base;
  }
  return std::string(bundleIdentifier);
}

}  // namespace Basalt
