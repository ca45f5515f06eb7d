// SPDX-License-Identifier: MIT
#pragma once

#include <string>

#include <nlohmann/json_fwd.hpp>

namespace Orvane {

/// The first member, "schemaVersion", of every object that the program prints. It changes when a
/// member changes its meaning, and not for a new one.
inline constexpr int schemaVersion = 1;

/// The value on a line of its own, keys in the order in which they were added. Bytes that are not
/// UTF-8, which JSON texts must be, show as U+FFFD.
[[nodiscard]] std::string jsonLine(const nlohmann::ordered_json& json);

/// The same within a line.
[[nodiscard]] std::string jsonText(const nlohmann::ordered_json& json);

/// The text of an object to which members can be added: "}" is still to come.
[[nodiscard]] std::string openJSONText(const nlohmann::ordered_json& json);

/// Adds a text under `key` and, where it is not UTF-8, all its bytes in hexadecimal digits under
/// the same with "Bytes" behind it.
void addText(nlohmann::ordered_json& json, const std::string& key, const std::string& text);

/// Adds a path under `key` and, as one that is not UTF-8 shows as another, its exact file URL under
/// `keyOfURL` then.
void addPath(nlohmann::ordered_json& json, const char* key, const char* keyOfURL,
             const std::string& path);

}  // namespace Orvane
