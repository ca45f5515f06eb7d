// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Text/PropertyListParser.h>

#include <plist/plist.h>

#include <algorithm>
#include <bit>
#include <cmath>
#include <cstdlib>

#include <Varnel/Platform/Text/NeutralLocale.h>
#include <Varnel/Platform/Text/PropertyListGuard.h>
#include <Varnel/Platform/Values/UniqueHandle.h>

namespace Varnel::Platform {
namespace {

constexpr std::size_t maxSize = std::size_t{16} << 20;

void release(void* memory) {
  std::free(memory);
}

using Tree = UniqueHandle<plist_t, plist_free>;
using Iterator = UniqueHandle<void*, release>;
using Text = UniqueHandle<char*, release>;

std::optional<PropertyValue> valueOf(plist_t node);

PropertyDictionary dictionaryOf(plist_t node) {
  PropertyDictionary dictionary;
  plist_dict_iter position = nullptr;
  plist_dict_new_iter(node, &position);
  const Iterator iterator(position);
  while (true) {
    char* rawKey = nullptr;
    plist_t child = nullptr;
    plist_dict_next_item(node, position, &rawKey, &child);
    const Text key(rawKey);
    if (!child) return dictionary;
    if (auto value = valueOf(child); key && value)
      dictionary.insert_or_assign(key.get(), *std::move(value));
  }
}

PropertyList listOf(plist_t node) {
  PropertyList list;
  plist_array_iter position = nullptr;
  plist_array_new_iter(node, &position);
  const Iterator iterator(position);
  while (true) {
    plist_t child = nullptr;
    plist_array_next_item(node, position, &child);
    if (!child) return list;
    if (auto value = valueOf(child)) list.push_back(*std::move(value));
  }
}

std::string stringOf(plist_t node) {
  std::uint64_t length = 0;
  const char* characters = plist_get_string_ptr(node, &length);
  return characters ? std::string(characters, length) : std::string();
}

PropertyData dataOf(plist_t node) {
  std::uint64_t length = 0;
  const char* first = plist_get_data_ptr(node, &length);
  if (!first) return {};
  PropertyData data(length);
  std::transform(first, first + length, data.begin(),
                 [](char byte) { return static_cast<std::byte>(byte); });
  return data;
}

// The library gives a date in 32 bits, and its fraction without a sign. The binary form that it
// writes has the whole date behind a header and a marker: the seconds from 2001, in floating point.
std::optional<PropertyValue> dateOf(plist_t node) {
  using namespace std::chrono;
  constexpr std::size_t position = 9;
  char* bytes = nullptr;
  std::uint32_t size = 0;
  plist_to_bin(node, &bytes, &size);
  const Text owner(bytes);
  if (!bytes || size < position + sizeof(double)) return std::nullopt;
  std::uint64_t bits = 0;
  for (const char byte : std::string_view(bytes + position, sizeof(double)))
    bits = bits << 8 | static_cast<unsigned char>(byte);
  const auto distance = std::bit_cast<double>(bits);
  constexpr double maxDistance = 9.0e12;
  if (!(std::abs(distance) <= maxDistance)) return std::nullopt;
  constexpr sys_days epoch = year_month_day(year(2001), January, day(1));
  return Date(epoch + microseconds(std::llround(distance * 1e6)));
}

// Absent for a value that has no counterpart.
std::optional<PropertyValue> valueOf(plist_t node) {
  switch (plist_get_node_type(node)) {
    case PLIST_BOOLEAN: {
      std::uint8_t value = 0;
      plist_get_bool_val(node, &value);
      return value != 0;
    }
    case PLIST_UINT: {
      std::uint64_t value = 0;
      plist_get_uint_val(node, &value);
      return static_cast<std::int64_t>(value);
    }
    case PLIST_UID: {
      std::uint64_t value = 0;
      plist_get_uid_val(node, &value);
      return static_cast<std::int64_t>(value);
    }
    case PLIST_REAL: {
      double value = 0;
      plist_get_real_val(node, &value);
      return value;
    }
    case PLIST_KEY: {
      char* characters = nullptr;
      plist_get_key_val(node, &characters);
      const Text text(characters);
      return text ? std::string(text.get()) : std::string();
    }
    case PLIST_STRING:
      return stringOf(node);
    case PLIST_DATA:
      return dataOf(node);
    case PLIST_DATE:
      return dateOf(node);
    case PLIST_ARRAY:
      return listOf(node);
    case PLIST_DICT:
      return dictionaryOf(node);
    default:
      return std::nullopt;
  }
}

Tree parse(std::string_view bytes) {
  constexpr std::string_view byteOrderMark = "\xEF\xBB\xBF";
  if (bytes.starts_with(byteOrderMark)) bytes.remove_prefix(byteOrderMark.size());
  const auto size = static_cast<std::uint32_t>(bytes.size());
  plist_t root = nullptr;
  if (bytes.starts_with("bplist00")) {
    if (isTameBinary(bytes)) plist_from_bin(bytes.data(), size, &root);
  } else {
    if (isTameXML(bytes)) plist_from_xml(bytes.data(), size, &root);
  }
  return Tree(root);
}

}  // namespace

std::optional<PropertyValue> parsePropertyList(std::string_view bytes) {
  if (bytes.empty() || bytes.size() > maxSize) return std::nullopt;
  const NeutralLocale neutral;
  const Tree tree = parse(bytes);
  return tree ? valueOf(tree.get()) : std::nullopt;
}

}  // namespace Varnel::Platform
