// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include <Varnel/Platform/Ports/CookieStorage.h>
#include <Varnel/Platform/Values/PropertyValue.h>

namespace Varnel {

/// The digest of "UUID name" in lower-case hexadecimal, with "(null)" in the place of a missing
/// UUID. The result is "(null)" when the text is not UTF-8. It must never change: servers know
/// users by it.
[[nodiscard]] std::string userIdentifierOf(const std::optional<std::string>& machineUUID,
                                           const std::string& loginName);

/// The last of these addresses as in "00:1b:63:84:45:e6", cut or filled with zeros to six bytes.
[[nodiscard]] std::optional<std::string> macAddressOf(
    const std::vector<Platform::PropertyData>& addresses);

/// The value of the first query item named "cid". Absent when the text is no URL, has no such item,
/// or the item has no value or one that is not UTF-8.
[[nodiscard]] std::optional<std::string> campaignOf(std::string_view url);

/// The client id in the first "_ga" cookie of exactly this domain: what follows the six characters
/// of version and depth ("GA1.2."). Absent when nothing follows, or the value is not UTF-8.
[[nodiscard]] std::optional<std::string> clientIdentifierIn(
    const std::vector<Platform::Cookie>& cookies, std::string_view domain);

}  // namespace Varnel
