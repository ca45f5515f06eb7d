// SPDX-License-Identifier: MIT
#include <Varnel/Basalt/JSON.h>

#include <utility>

#include <fmt/format.h>
#include <nlohmann/json.hpp>

#include <Varnel/Platform/Text/NeutralLocale.h>

namespace Basalt {
namespace {

using Library = nlohmann::json;
using Varnel::Platform::PropertyData;
using Varnel::Platform::PropertyDictionary;
using Varnel::Platform::PropertyList;

constexpr int maxDepth = 512;

JSONError noJSONAt(std::size_t byte) {
  return JSONError::withMessage(fmt::format("Unable to read JSON at byte {}", byte));
}

// Called before anything deeper is read.
bool isWithinDepth(int depth, Library::parse_event_t, Library&) {
  if (depth < maxDepth) return true;
  throw JSONError::withMessage("Unable to read JSON: it is nested too deep");
}

JSON valueOf(Library&& json) {
  switch (json.type()) {
    case Library::value_t::boolean:
      return json.get<bool>();
    case Library::value_t::number_integer:
      return json.get<std::int64_t>();
    case Library::value_t::number_unsigned:
      if (std::in_range<std::int64_t>(json.get<std::uint64_t>())) return json.get<std::int64_t>();
      return json.get<double>();
    case Library::value_t::number_float:
      return json.get<double>();
    case Library::value_t::string:
      return std::move(json.get_ref<std::string&>());
    case Library::value_t::array: {
      PropertyList list;
      list.reserve(json.size());
      for (Library& element : json) list.push_back(valueOf(std::move(element)));
      return list;
    }
    case Library::value_t::object: {
      PropertyDictionary dictionary;
      for (auto& [key, value] : json.get_ref<Library::object_t&>())
        dictionary.emplace_hint(dictionary.end(), key, valueOf(std::move(value)));
      return dictionary;
    }
    default:
      return nullptr;
  }
}

struct Writer {
  template <typename Scalar>
  Library operator()(const Scalar& value) const {
    return value;
  }

  Library operator()(const PropertyData&) const { return nullptr; }
  Library operator()(Varnel::Platform::Date) const { return nullptr; }

  Library operator()(const PropertyList& values) const {
    Library list = Library::array();
    for (const JSON& value : values) list.push_back(value.visit(*this));
    return list;
  }

  Library operator()(const PropertyDictionary& values) const {
    Library object = Library::object();
    for (const auto& [key, value] : values) object[key] = value.visit(*this);
    return object;
  }
};

}  // namespace

JSONError::JSONError(Kind kind, const std::string& text, std::string typeName, std::string path)
    : std::runtime_error(text),
      kind_(kind),
      typeName_(std::move(typeName)),
      path_(std::move(path)) {}

JSONError JSONError::typeMismatch(std::string typeName, std::string path) {
  const std::string text = fmt::format("Unable to import {} at {}: wrong type", typeName, path);
  return {Kind::typeMismatch, text, std::move(typeName), std::move(path)};
}

JSONError JSONError::missingValue(std::string typeName, std::string path) {
  const std::string text = fmt::format("Unable to import {} at {}: no value", typeName, path);
  return {Kind::missingValue, text, std::move(typeName), std::move(path)};
}

JSONError JSONError::withMessage(const std::string& message) {
  return {Kind::message, message, {}, {}};
}

JSON parseJSON(std::string_view text) {
  // The library would take a zero for the end.
  if (const auto zero = text.find('\0'); zero != text.npos) throw noJSONAt(zero + 1);
  const Varnel::Platform::NeutralLocale neutral;
  try {
    return valueOf(Library::parse(text, &isWithinDepth));
  } catch (const Library::parse_error& error) {
    throw noJSONAt(error.byte);
  } catch (const Library::out_of_range&) {
    throw JSONError::withMessage("Unable to read JSON: a number is too large");
  }
}

std::string jsonText(const JSON& json) {
  return json.visit(Writer()).dump(-1, ' ', false, Library::error_handler_t::replace);
}

std::string importString(const JSON& json, std::string_view key, std::string_view typeName) {
  const auto* object = json.as<PropertyDictionary>();
  if (!object) throw JSONError::typeMismatch(std::string(typeName), "root");
  const JSON* value = find(*object, key);
  if (!value) throw JSONError::missingValue(std::string(typeName), std::string(key));
  const auto* text = value->as<std::string>();
  if (!text) throw JSONError::typeMismatch(std::string(typeName), std::string(key));
  return *text;
}

std::vector<std::string> importStrings(const JSON& json, std::string_view typeName) {
  const auto mismatch = [&] { return JSONError::typeMismatch(std::string(typeName), "root"); };
  const auto* list = json.as<PropertyList>();
  if (!list) throw mismatch();
  std::vector<std::string> strings;
  strings.reserve(list->size());
  for (const JSON& element : *list) {
    const auto* text = element.as<std::string>();
    if (!text) throw mismatch();
    strings.push_back(*text);
  }
  return strings;
}

}  // namespace Basalt
