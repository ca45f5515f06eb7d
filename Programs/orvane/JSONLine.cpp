// SPDX-License-Identifier: MIT
#include <orvane/JSONLine.h>

#include <nlohmann/json.hpp>

#include <Varnel/Platform/Values/URL.h>
#include <Varnel/Platform/Values/UTF8.h>

namespace Orvane {

std::string jsonLine(const nlohmann::ordered_json& json) {
  return json.dump(-1, ' ', false, nlohmann::ordered_json::error_handler_t::replace) + "\n";
}

void addPath(nlohmann::ordered_json& json, const char* key, const char* keyOfURL,
             const std::string& path) {
  json[key] = path;
  if (!Varnel::Platform::isValidUTF8(path))
    json[keyOfURL] = Varnel::Platform::URL::fileURLWithPath(path).absoluteString();
}

}  // namespace Orvane
