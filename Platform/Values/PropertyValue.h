// SPDX-License-Identifier: MIT
#pragma once

#include <concepts>
#include <cstddef>
#include <cstdint>
#include <map>
#include <string>
#include <string_view>
#include <type_traits>
#include <utility>
#include <variant>
#include <vector>

#include <Varnel/Platform/Values/Date.h>

namespace Varnel::Platform {

class PropertyValue;

using PropertyData = std::vector<std::byte>;
using PropertyList = std::vector<PropertyValue>;
using PropertyDictionary = std::map<std::string, PropertyValue, std::less<>>;

/// A value as property lists, device registries and JSON hold it: null, a truth value, a number, a
/// text, bytes, a date, a list or a dictionary. Only JSON has nulls; it has neither bytes nor
/// dates. Text is UTF-8 where its source says so and otherwise untouched.
///
///     const PropertyValue* serial = find(characteristics, "Serial Number");
///     if (const auto* text = serial ? serial->as<std::string>() : nullptr) use(*text);
///
/// A plain value; threads may share one as any other value. Pointers into it live as long as it.
class PropertyValue final {
 public:
  using Storage = std::variant<std::nullptr_t, bool, std::int64_t, double, std::string,
                               PropertyData, Date, PropertyList, PropertyDictionary>;

  /// Null, which is a value too. A value that is missing altogether is an absent `PropertyValue`.
  PropertyValue(std::nullptr_t) : storage_(nullptr) {}
  /// Truth values only: no pointer and no number is converted.
  template <std::same_as<bool> Truth>
  PropertyValue(Truth value) : storage_(value) {}
  /// Any whole number that 64 bits with a sign hold.
  template <std::integral Number>
  requires(!std::same_as<Number, bool> && (std::is_signed_v<Number> || sizeof(Number) < 8))
      PropertyValue(Number value)
      : storage_(static_cast<std::int64_t>(value)) {}
  /// Whole numbers are not converted to it.
  template <std::floating_point Number>
  PropertyValue(Number value) : storage_(static_cast<double>(value)) {}
  PropertyValue(std::string value) : storage_(std::move(value)) {}
  PropertyValue(std::string_view value) : storage_(std::string(value)) {}
  PropertyValue(const char* value) : storage_(std::string(value)) {}
  PropertyValue(PropertyData value) : storage_(std::move(value)) {}
  PropertyValue(Date value) : storage_(value) {}
  PropertyValue(PropertyList value) : storage_(std::move(value)) {}
  PropertyValue(PropertyDictionary value) : storage_(std::move(value)) {}

  /// The value if it has exactly this type, else null. Nothing is converted.
  template <typename Type>
  [[nodiscard]] const Type* as() const {
    return std::get_if<Type>(&storage_);
  }

  /// The answer of `visitor` for the value as its own type.
  template <typename Visitor>
  decltype(auto) visit(Visitor&& visitor) const {
    return std::visit(std::forward<Visitor>(visitor), storage_);
  }

  bool operator==(const PropertyValue&) const = default;

 private:
  Storage storage_;
};

/// The value under `key`, or null.
[[nodiscard]] inline const PropertyValue* find(const PropertyDictionary& dictionary,
                                               std::string_view key) {
  const auto found = dictionary.find(key);
  return found == dictionary.end() ? nullptr : &found->second;
}

/// The value under `key` if there is one of this type, else null.
template <typename Type>
[[nodiscard]] const Type* findAs(const PropertyDictionary& dictionary, std::string_view key) {
  const PropertyValue* value = find(dictionary, key);
  return value ? value->as<Type>() : nullptr;
}

}  // namespace Varnel::Platform
