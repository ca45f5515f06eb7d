// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <vector>

#include <Varnel/Platform/Api.h>

namespace Varnel::Platform {

/// One item of a URL's query, decoded. Without a value it is a bare name, a flag; an empty value is
/// a value.
struct VARNEL_API URLQueryItem final {
  std::string name;
  std::optional<std::string> value;

  bool operator==(const URLQueryItem&) const = default;
};

/// The items of an encoded query, in order. Only "&" separates items, and only the first "=" of an
/// item separates its name from its value; "+" is a plus. An empty query has no items; between two
/// neighbouring "&" stands an item with an empty name.
[[nodiscard]] VARNEL_API std::vector<URLQueryItem> decodedURLQuery(std::string_view query);

/// The query of these items: letters, digits and "-._~!$'()*+,:;@/?" stay, every other byte is
/// percent-encoded. `decodedURLQuery` gives the same items back, except for a query of one empty
/// flag.
///
///     encodedURLQuery(items);  // "ov2&product=Orvane%202&source="
[[nodiscard]] VARNEL_API std::string encodedURLQuery(std::span<const URLQueryItem> items);

}  // namespace Varnel::Platform
