// SPDX-License-Identifier: MIT
#include <Platform/Values/URLQuery.h>

#include <Platform/Values/PercentEncoding.h>

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

std::string encodedURLQuery(std::span<const URLQueryItem> items) {
  std::size_t size = 0;
  for (const URLQueryItem& item : items) {
    size += percentEncodedSize(item.name, itemBytes) + 1;
    if (item.value) size += percentEncodedSize(*item.value, itemBytes) + 1;
  }
  std::string query;
  query.reserve(size);
  for (const URLQueryItem& item : items) {
    if (&item != items.data()) query += '&';
    appendPercentEncoded(query, item.name, itemBytes);
    if (item.value) appendPercentEncoded(query += '=', *item.value, itemBytes);
  }
  return query;
}

}  // namespace Varnel::Platform
