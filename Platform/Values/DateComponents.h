// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <optional>

namespace Varnel::Platform {

/// An amount of calendar time, unit by unit. A unit that is not set counts as 0.
///
///     const DateComponents quarter{.month = 3};
///
/// How long it is depends on where in the calendar it is added: see `Calendar`. A plain value.
struct DateComponents final {
  std::optional<std::int64_t> year = std::nullopt;
  std::optional<std::int64_t> month = std::nullopt;
  std::optional<std::int64_t> day = std::nullopt;
  std::optional<std::int64_t> hour = std::nullopt;
  std::optional<std::int64_t> minute = std::nullopt;
  std::optional<std::int64_t> second = std::nullopt;

  bool operator==(const DateComponents&) const = default;
};

}  // namespace Varnel::Platform
