// SPDX-License-Identifier: MIT
#include <Varnel/GTK3/DisplayTexts.h>
#include <Varnel/Paths/QNURLResolver.h>
#include <Varnel/Platform/Ports/Ports.h>
#include <Varnel/Platform/Ports/UserLocale.h>
#include <Varnel/Platform/Text/ByteCountFormatter.h>
#include <Varnel/Platform/Text/VisibleText.h>
#include <Varnel/Platform/Values/PathComponents.h>

namespace Varnel::GTK3 {

std::string pathText(const Platform::URL& url, PathKind kind) {
  return shownText(
      QNURLResolver::shared()
          .abbreviatedPathForComponents(Platform::pathComponents(url), kind == PathKind::folder)
          .value_or(""));
}

std::string sizeText(std::int64_t bytes) {
  static const auto& formatter = *new Platform::ByteCountFormatter(
      Platform::processPorts().userLocale.get().numberIdentifier());
  return formatter.string(bytes, Platform::ByteCountStyle::file);
}

std::string shownText(std::string_view bytes) {
  return Platform::visibleText(std::string(bytes), Platform::Backslashes::kept);
}

}  // namespace Varnel::GTK3
