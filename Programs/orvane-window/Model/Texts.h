// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <initializer_list>
#include <string>
#include <string_view>

namespace Orvane {

/// The window's text under a key, in the user's language and with the product's name; the key where
/// there is none. Any thread.
[[nodiscard]] std::string localized(std::string_view key);

/// The same with values in their places: localized("Selected", {count, size}).
[[nodiscard]] std::string localized(std::string_view key,
                                    std::initializer_list<std::string_view> values);

/// "2.5 GB".
[[nodiscard]] std::string sizeText(std::uint64_t bytes);

/// A number with the separators of the process's locale.
[[nodiscard]] std::string countText(std::uint64_t count);

/// A path for people: abbreviated, and with visible signs for what is no text.
[[nodiscard]] std::string pathText(const std::string& path, bool isFolder = false);

}  // namespace Orvane
