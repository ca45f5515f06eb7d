// SPDX-License-Identifier: MIT
#include <Varnel/Basalt/JSON.h>

#include <utility>

#include <fmt/format.h>
#include <nlohmann/json.hpp>

namespace Basalt {

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

std::string importString(const JSON& json, std::string_view key, std::string_view typeName) {
  if (!json.is_object()) throw JSONError::typeMismatch(std::string(typeName), "root");
  const auto value = json.find(key);
  if (value == json.end()) throw JSONError::missingValue(std::string(typeName), std::string(key));
  if (!value->is_string()) throw JSONError::typeMismatch(std::string(typeName), std::string(key));
  return value->get<std::string>();
}

std::vector<std::string> importStrings(const JSON& json, std::string_view typeName) {
  const auto mismatch = [&] { return JSONError::typeMismatch(std::string(typeName), "root"); };
  if (!json.is_array()) throw mismatch();
  std::vector<std::string> strings;
  strings.reserve(json.size());
  for (const JSON& element : json) {
    if (!element.is_string()) throw mismatch();
    strings.push_back(element.get<std::string>());
  }
  return strings;
}

}  // namespace Basalt
