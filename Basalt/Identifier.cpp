// SPDX-License-Identifier: MIT
#include <Basalt/Identifier.h>

namespace Basalt {

std::string identifier(std::string_view base, std::string_view component) {
  if (base.empty() || component.empty()) return {};
  std::string joined(base);
  joined += '.';
  joined += component;
  return joined;
}

std::string baseBundleIdentifier(std::string_view bundleIdentifier) {
  std::string base;
  while (!bundleIdentifier.empty()) {
    const std::size_t end = bundleIdentifier.find('.');
    const std::string_view component = bundleIdentifier.substr(0, end);
    if (component != "site" && component != "trial") {
      if (!base.empty()) base += '.';
      base += component;
    }
    bundleIdentifier = end == std::string_view::npos ? "" : bundleIdentifier.substr(end + 1);
  }
  return base;
}

}  // namespace Basalt
