// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Text/KeyedArchive.h>

#include <Varnel/Platform/Text/PropertyListParser.h>
#include <Varnel/Platform/Text/PropertyListWriter.h>

namespace Varnel::Platform {

void KeyedArchiver::encode(std::string key, const URL& fileURL) {
  values_.insert_or_assign(std::move(key), fileURL.absoluteString());
}

std::string KeyedArchiver::bytes() const {
  // Keys and percent-encoded URLs are ASCII, which is always written.
  return writePropertyList(values_).value_or(std::string());
}

std::optional<KeyedUnarchiver> KeyedUnarchiver::open(std::string_view bytes) {
  const auto root = parsePropertyList(bytes);
  const auto* values = root ? root->as<PropertyDictionary>() : nullptr;
  if (!values) return std::nullopt;
  return KeyedUnarchiver(*values);
}

std::optional<URL> KeyedUnarchiver::decodeURL(std::string_view key) const {
  const auto* text = findAs<std::string>(values_, key);
  if (!text) return std::nullopt;
  return URL::fileURLWithAbsoluteString(*text);
}

}  // namespace Varnel::Platform
