// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

#include <orvane/ProductData.h>

namespace Orvane {

/// How many events, files, reminders or logs a part holds; absent for settings, and where it cannot
/// be read.
[[nodiscard]] std::optional<std::int64_t> entriesOf(const DataPart& part);

/// What the product keeps, for people: a line a part.
[[nodiscard]] std::string textOf(const std::vector<DataPart>& parts);

}  // namespace Orvane
