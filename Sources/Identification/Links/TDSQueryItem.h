// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <string>
#include <utility>

#include <Varnel/Platform/Values/URLQuery.h>

namespace Varnel {

/// One parameter of a link: a name with a value, or a bare name, a flag. An immutable value.
class TDSQueryItem final {
 public:
  TDSQueryItem(std::string name, std::optional<std::string> value)
      : item_{std::move(name), std::move(value)} {}

  [[nodiscard]] const std::string& name() const { return item_.name; }
  [[nodiscard]] const std::optional<std::string>& value() const { return item_.value; }

  /// The same pair as an item of a URL's query.
  [[nodiscard]] const Platform::URLQueryItem& urlQuery() const { return item_; }

  bool operator==(const TDSQueryItem&) const = default;

 private:
  Platform::URLQueryItem item_;
};

}  // namespace Varnel
