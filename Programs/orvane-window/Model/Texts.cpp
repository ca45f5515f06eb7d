// SPDX-License-Identifier: MIT
#include <orvane-window/Model/Texts.h>

#include <algorithm>
#include <clocale>
#include <limits>

#include <Varnel/Context/Bundle.h>
#include <Varnel/Context/Globals.h>
#include <Varnel/Paths/QNURLResolver.h>
#include <Varnel/Platform/Ports/Ports.h>
#include <Varnel/Platform/Ports/UserLocale.h>
#include <Varnel/Platform/Text/ByteCountFormatter.h>
#include <Varnel/Platform/Text/TextFormat.h>
#include <Varnel/Platform/Text/VisibleText.h>

namespace Orvane {

std::string localized(std::string_view key) {
  static const Varnel::Bundle bundle = Varnel::Bundle::main();
  return Varnel::Globals::substitutingApplicationName(bundle.localizedString(key));
}

std::string localized(std::string_view key, std::initializer_list<std::string_view> values) {
  return Varnel::Platform::formatted(localized(key), values);
}

std::string sizeText(std::uint64_t bytes) {
  static const Varnel::Platform::ByteCountFormatter formatter(
      Varnel::Platform::processPorts().userLocale.get().numberIdentifier());
  constexpr std::uint64_t max = std::numeric_limits<std::int64_t>::max();
  return formatter.string(static_cast<std::int64_t>(std::min(bytes, max)),
                          Varnel::Platform::ByteCountStyle::file);
}

std::string countText(std::uint64_t count) {
  std::string digits = std::to_string(count);
  const std::string separator = std::localeconv()->thousands_sep;
  for (std::size_t end = digits.size(); end > 3; end -= 3) digits.insert(end - 3, separator);
  return digits;
}

std::string pathText(const std::string& path, bool isFolder) {
  return Varnel::Platform::visibleText(
      Varnel::QNURLResolver::shared().abbreviatedPath(path, isFolder));
}

}  // namespace Orvane
