// SPDX-License-Identifier: MIT
#include <Varnel/Identification/User/IdentifierRules.h>

#include <algorithm>

#include <Varnel/Basalt/Digest.h>
#include <Varnel/Platform/Values/URL.h>
#include <Varnel/Platform/Values/URLQuery.h>
#include <Varnel/Platform/Values/UTF8.h>

namespace Varnel {
namespace {

constexpr const char* nothing = "(null)";

bool continuesCharacter(char byte) {
  return (static_cast<unsigned char>(byte) & 0xC0) == 0x80;
}

// The part of a UTF-8 text after its first `count` characters.
std::string_view withoutFirstCharacters(std::string_view text, int count) {
  for (; count > 0 && !text.empty(); --count) {
    text.remove_prefix(1);
    while (!text.empty() && continuesCharacter(text.front())) text.remove_prefix(1);
  }
  return text;
}

}  // namespace

std::string userIdentifierOf(const std::optional<std::string>& machineUUID,
                             const std::string& loginName) {
  const std::string text = machineUUID.value_or(nothing) + ' ' + loginName;
  if (!Platform::isValidUTF8(text)) return nothing;
  return Basalt::hexadecimal(Basalt::sha256(text));
}

std::optional<std::string> macAddressOf(const std::vector<Platform::PropertyData>& addresses) {
  if (addresses.empty()) return std::nullopt;
  Platform::PropertyData bytes = addresses.back();
  bytes.resize(6);
  std::string text;
  for (const std::byte byte : bytes) {
    if (!text.empty()) text += ':';
    text += Basalt::hexadecimal({reinterpret_cast<const char*>(&byte), 1});
  }
  return text;
}

std::optional<std::string> campaignOf(std::string_view text) {
  const auto url = Platform::URL::parse(text);
  const auto query = url ? url->components().query : std::nullopt;
  if (!query) return std::nullopt;
  const auto items = Platform::decodedURLQuery(*query);
  const auto found =
      std::find_if(items.begin(), items.end(), [](const auto& item) { return item.name == "cid"; });
  if (found == items.end() || !found->value || !Platform::isValidUTF8(*found->value))
    return std::nullopt;
  return found->value;
}

std::optional<std::string> clientIdentifierIn(const std::vector<Platform::Cookie>& cookies,
                                              std::string_view domain) {
  constexpr int lengthOfPrefix = 6;
  const auto found = std::find_if(cookies.begin(), cookies.end(), [&](const auto& cookie) {
    return cookie.domain == domain && cookie.name == "_ga";
  });
  if (found == cookies.end() || !Platform::isValidUTF8(found->value)) return std::nullopt;
  const std::string_view rest = withoutFirstCharacters(found->value, lengthOfPrefix);
  if (rest.empty()) return std::nullopt;
  return std::string(rest);
}

}  // namespace Varnel
