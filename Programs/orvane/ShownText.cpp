// SPDX-License-Identifier: MIT
#include <orvane/ShownText.h>

#include <algorithm>

#include <Varnel/Paths/QNURLResolver.h>
#include <Varnel/Platform/Ports/Ports.h>
#include <Varnel/Platform/Ports/UserLocale.h>
#include <Varnel/Platform/Text/ByteCountFormatter.h>
#include <Varnel/Platform/Text/VisibleText.h>
#include <orvane/TextColumns.h>

namespace Orvane {

std::string counted(std::uint64_t count, const char* singular, const char* plural) {
  return std::to_string(count) + " " + (count == 1 ? singular : plural);
}

std::string shownSize(std::uint64_t bytes) {
  static const Varnel::Platform::ByteCountFormatter byteCounts(
      Varnel::Platform::processPorts().userLocale.get().numberIdentifier());
  return byteCounts.string(static_cast<std::int64_t>(bytes),
                           Varnel::Platform::ByteCountStyle::file);
}

std::string shownPath(const std::string& path) {
  return Varnel::Platform::visibleText(Varnel::QNURLResolver::shared().abbreviatedPath(path));
}

namespace {

/// Where the first word ends. A quote that closes has punctuation behind it, if anything: others
/// belong to what is quoted.
std::size_t endOfWord(std::string_view text) {
  std::size_t end = 0;
  if (text.starts_with('"')) do
      end = text.find('"', end + 1);
    while (end != text.npos && end + 1 < text.size() &&
           std::string_view(" \n,:;.)").find(text[end + 1]) == text.npos);
  return std::min(text.find_first_of(" \n", end), text.size());
}

}  // namespace

std::string wrapped(std::string_view text, std::size_t columns) {
  if (columns == 0) return std::string(text);
  std::string lines;
  std::size_t column = 0;
  while (!text.empty()) {
    const std::size_t length = endOfWord(text);
    const std::string_view word = text.substr(0, length);
    const std::size_t width = columnsOf(word);
    if (column > 0) {
      const bool hasRoom = column + 1 + width <= columns;
      lines += hasRoom ? ' ' : '\n';
      column = hasRoom ? column + 1 : 0;
    }
    lines += word;
    column += width;
    const bool endsLine = length < text.size() && text[length] == '\n';
    if (endsLine) lines += '\n';
    if (endsLine) column = 0;
    text.remove_prefix(std::min(length + 1, text.size()));
  }
  return lines;
}

}  // namespace Orvane
