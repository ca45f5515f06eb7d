// SPDX-License-Identifier: MIT
#include <Varnel/Provenance/EventFilters.h>

#include <algorithm>
#include <array>
#include <utility>

namespace Varnel {
namespace {

constexpr std::string_view productWord = "orvane";

bool startsWithProductWord(std::string_view text) {
  const auto equalInAnyCase = [](char letter, char c) {
    return c == letter || (c >= 'A' && c <= 'Z' && c - 'A' + 'a' == letter);
  };
  return text.size() >= productWord.size() &&
         std::equal(productWord.begin(), productWord.end(), text.begin(), equalInAnyCase);
}

// The length of the dash, underscore or white-space character that the text begins with, or 0.
std::size_t lengthOfSeparator(std::string_view text) {
  constexpr std::array<std::string_view, 25> separators = {
      "-",      "_",      " ",      "\t",     "\n",     "\f",     "\r",     "\u00A0", "\u1680",
      "\u2000", "\u2001", "\u2002", "\u2003", "\u2004", "\u2005", "\u2006", "\u2007", "\u2008",
      "\u2009", "\u200A", "\u2028", "\u2029", "\u202F", "\u205F", "\u3000"};
  for (const std::string_view separator : separators)
    if (text.starts_with(separator)) return separator.size();
  return 0;
}

// The pattern is matched by hand: a general matcher recurses for each character, and the URLs come
// from anywhere.
bool containsProductName(std::string_view text) {
  for (; !text.empty(); text.remove_prefix(1)) {
    if (!startsWithProductWord(text)) continue;
    std::string_view rest = text.substr(productWord.size());
    while (const std::size_t length = lengthOfSeparator(rest)) rest.remove_prefix(length);
    if (rest.starts_with('2')) return true;
  }
  return false;
}

}  // namespace

EventFilter eventIdentifierFilter(std::string identifier) {
  return [identifier = std::move(identifier)](const KVQuarantineEntry& entry) {
    return entry.eventIdentifier() == identifier;
  };
}

EventFilter nameFilter() {
  return [](const KVQuarantineEntry& entry) {
    return entry.dataURLString() && containsProductName(*entry.dataURLString());
  };
}

std::optional<KVQuarantineEntry> filterEvent(const std::vector<KVQuarantineEntry>& entries,
                                             const EventFilter& filter) {
  const KVQuarantineEntry* newest = nullptr;
  for (const KVQuarantineEntry& entry : entries)
    if (filter(entry) && (!newest || entry.timestamp() > newest->timestamp())) newest = &entry;
  if (!newest) return std::nullopt;
  return *newest;
}

std::optional<std::string> eventIdentifierIn(
    const std::optional<std::vector<std::string>>& fields) {
  constexpr std::size_t identifierField = 3;
  if (!fields || fields->size() <= identifierField) return std::nullopt;
  return (*fields)[identifierField];
}

}  // namespace Varnel
