// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Linux/Notifications/HostName.h>

#include <glib.h>

#include <cstddef>
#include <string_view>

#include <Varnel/Platform/Values/UniqueHandle.h>

namespace Varnel::Platform::Linux {
namespace {

using Text = UniqueHandle<char*, g_free>;

constexpr std::string_view prefix = "com.quennel.Varnel.Host.";
constexpr std::size_t maxLength = 255;
constexpr std::size_t digestLength = 64;

std::string escaped(unsigned char byte) {
  constexpr const char* digits = "0123456789abcdef";
  return {'_', digits[byte / 16], digits[byte % 16]};
}

// An element of a name starts with no digit and is not empty.
std::string escaped(std::string_view identifier) {
  std::string text;
  bool isFirst = true;
  for (std::size_t i = 0; i < identifier.size(); ++i) {
    const char c = identifier[i];
    const bool isEnd = i + 1 == identifier.size();
    const bool isPlain =
        c == '.' ? !isFirst && !isEnd : g_ascii_isalpha(c) || (g_ascii_isdigit(c) && !isFirst);
    text += isPlain ? std::string(1, c) : escaped(static_cast<unsigned char>(c));
    isFirst = isPlain && c == '.';
  }
  return text.empty() ? "_" : text;
}

std::string nameOf(const std::string& baseIdentifier, std::string_view suffix) {
  const std::size_t room = maxLength - prefix.size() - suffix.size();
  std::string middle = escaped(baseIdentifier);
  if (middle.size() > room) {
    const Text digest(g_compute_checksum_for_string(G_CHECKSUM_SHA256, middle.c_str(), -1));
    // No escape looks like this.
    middle = middle.substr(0, room - digestLength - 2) + "__" + digest.get();
  }
  return std::string(prefix) + middle + std::string(suffix);
}

}  // namespace

std::string hostName(const std::string& baseIdentifier) {
  return nameOf(baseIdentifier, ".Client");
}

std::string frontName(const std::string& baseIdentifier) {
  return nameOf(baseIdentifier, ".Front");
}

}  // namespace Varnel::Platform::Linux
