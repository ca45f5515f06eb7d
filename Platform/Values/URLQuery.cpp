// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Values/URLQuery.h>

#include <Varnel/Platform/Values/PercentEncoding.h>

namespace Varnel::Platform {
namespace {

constexpr ByteSet itemBytes = alphanumericAnd("-._~!$'()*+,:;@/?");

URLQueryItem decodedItem(std::string_view text) {
  const std::size_t mark = text.find('=');
  if (mark == std::string_view::npos) return {percentDecoded(text), std::nullopt};
  return {percentDecoded(text.substr(0, mark)), percentDecoded(text.substr(mark + 1))};
}

}  // namespace

std::vector<URLQueryItem> decodedURLQuery(std::string_view query) {
  std::vector<URLQueryItem> items;
  if (query.empty()) return items;
  for (;;) {
    const std::size_t end = query.find('&');
    items.push_back(decodedItem(query.substr(0, end)));
    if (end == std::string_view::npos) return items;
    query.remove_prefix(end + 1);
  }
}

// Room for the worst case and one pass are cheaper than two passes over the text.
std::string encodedURLQuery(std::span<const URLQueryItem> items) {
  std::size_t room = 0;
  for (const URLQueryItem& item : items)
    room += (item.name.size() + (item.value ? item.value->size() : 0)) * percentEncodedByteSize + 2;
  std::string query(room, '\0');
  char* out = query.data();
  for (const URLQueryItem& item : items) {
    if (&item != items.data()) *out++ = '&';
    out = writePercentEncoded(out, item.name, itemBytes);
    if (!item.value) continue;
    *out++ = '=';
    out = writePercentEncoded(out, *item.value, itemBytes);
  }
  query.resize(static_cast<std::size_t>(out - query.data()));
  return query;
}

}  // namespace Varnel::Platform
