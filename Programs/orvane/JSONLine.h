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

}  // namespace Orvane
