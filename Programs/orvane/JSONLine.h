// SPDX-License-Identifier: MIT
#pragma once

#include <string>

#include <nlohmann/json_fwd.hpp>

namespace Orvane {

/// The value on a line of its own, keys in the order in which they were added. Bytes that are not
/// UTF-8, which JSON texts must be, show as U+FFFD.
[[nodiscard]] std::string jsonLine(const nlohmann::ordered_json& json);

}  // namespace Orvane
