// SPDX-License-Identifier: MIT
#pragma once

#include <map>
#include <string>

namespace Varnel::Tests {

/// An XML property list of texts. The texts must not need escaping.
inline std::string propertyList(const std::map<std::string, std::string>& texts) {
  std::string xml = R"(<?xml version="1.0" encoding="UTF-8"?><plist version="1.0"><dict>)";
  for (const auto& [key, text] : texts)
    xml += "<key>" + key + "</key><string>" + text + "</string>";
  return xml + "</dict></plist>";
}

}  // namespace Varnel::Tests
