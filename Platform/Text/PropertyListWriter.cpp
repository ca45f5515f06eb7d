// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Text/PropertyListWriter.h>

#include <plist/plist.h>

#include <algorithm>
#include <limits>

#include <Varnel/Platform/Text/NeutralLocale.h>
#include <Varnel/Platform/Values/UTF8.h>
#include <Varnel/Platform/Values/UniqueHandle.h>

namespace Varnel::Platform {
namespace {

using Node = UniqueHandle<plist_t, plist_free>;
using XMLText = UniqueHandle<char*, VARNEL_PLIST_FREE_TEXT>;

// Property lists count from 2001-01-01.
constexpr Date referenceDate{std::chrono::sys_days(std::chrono::year(2001) / 1 / 1)};

bool isText(std::string_view bytes) {
  const auto isControl = [](char c) {
    return static_cast<unsigned char>(c) < 0x20 && c != '\t' && c != '\n';
  };
  if (std::any_of(bytes.begin(), bytes.end(), isControl)) return false;
  return isValidUTF8(bytes);
}

plist_t makeNode(const PropertyValue& value);

// One overload for each kind of value; null for a value that cannot be written.
struct NodeMaker {
  plist_t operator()(std::nullptr_t) const { return nullptr; }
  plist_t operator()(bool value) const { return plist_new_bool(value ? 1 : 0); }
  plist_t operator()(double value) const { return plist_new_real(value); }

  plist_t operator()(std::int64_t value) const {
    return value < 0 ? nullptr : plist_new_uint(static_cast<std::uint64_t>(value));
  }

  plist_t operator()(const std::string& value) const {
    return isText(value) ? plist_new_string(value.c_str()) : nullptr;
  }

  plist_t operator()(const PropertyData& value) const {
    return plist_new_data(reinterpret_cast<const char*>(value.data()), value.size());
  }

  plist_t operator()(Date value) const {
    const auto seconds = std::chrono::floor<std::chrono::seconds>(value - referenceDate);
    using Limits = std::numeric_limits<std::int32_t>;
    if (seconds.count() < Limits::min() || seconds.count() > Limits::max()) return nullptr;
    return plist_new_date(static_cast<std::int32_t>(seconds.count()), 0);
  }

  plist_t operator()(const PropertyList& values) const {
    Node list(plist_new_array());
    for (const PropertyValue& value : values) {
      plist_t item = makeNode(value);
      if (!item) return nullptr;
      plist_array_append_item(list.get(), item);
    }
    return list.release();
  }

  plist_t operator()(const PropertyDictionary& values) const {
    Node dictionary(plist_new_dict());
    for (const auto& [key, value] : values) {
      plist_t item = isText(key) ? makeNode(value) : nullptr;
      if (!item) return nullptr;
      plist_dict_set_item(dictionary.get(), key.c_str(), item);
    }
    return dictionary.release();
  }
};

plist_t makeNode(const PropertyValue& value) {
  return value.visit(NodeMaker());
}

}  // namespace

std::optional<std::string> writePropertyList(const PropertyValue& value) {
  const NeutralLocale neutral;
  const Node root(makeNode(value));
  if (!root) return std::nullopt;
  char* text = nullptr;
  std::uint32_t length = 0;
  plist_to_xml(root.get(), &text, &length);
  const XMLText owner(text);
  if (!text) return std::nullopt;
  return std::string(text, length);
}

}  // namespace Varnel::Platform
