// SPDX-License-Identifier: MIT
#include <orvane/JSONLine.h>

#include <fmt/format.h>

#include <nlohmann/json.hpp>

#include <Varnel/Platform/Values/URL.h>
#include <Varnel/Platform/Values/UTF8.h>

namespace Orvane {

std::string jsonText(const nlohmann::ordered_json& json) {
  return json.dump(-1, ' ', false, nlohmann::ordered_json::error_handler_t::replace);
}

std::string openJSONText(const nlohmann::ordered_json& json) {
  std::string text = jsonText(json);
  text.pop_back();
  return text;
}

std::string jsonLine(const nlohmann::ordered_json& json) {
  return jsonText(json) + "\n";
}

void addText(nlohmann::ordered_json& json, const std::string& key, const std::string& text) {
  json[key] = text;
  if (Varnel::Platform::isValidUTF8(text)) return;
  std::string digits;
  for (const char byte : text) digits += fmt::format("{:02x}", static_cast<unsigned char>(byte));
  json[key + "Bytes"] = digits;
}

void addPath(nlohmann::ordered_json& json, const char* key, const char* keyOfURL,
             const std::string& path) {
  json[key] = path;
  if (!Varnel::Platform::isValidUTF8(path))
    json[keyOfURL] = Varnel::Platform::URL::fileURLWithPath(path).absoluteString();
}

}  // namespace Orvane
