// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <string>

#include <Varnel/Platform/Api.h>
#include <Varnel/Platform/Values/Date.h>

namespace Varnel::Platform {

/// Writes lengths of time in English with abbreviated units: "1h 5m 3s".
///
/// The units are y, mo, d, h, m and s, counted on the calendar from a fixed start; units of zero
/// are left out, and "0s" is the text of no length at all. Fractions of a second are cut off. In a
/// negative length only the first unit has the minus. Immutable; any thread.
class VARNEL_API DurationFormatter final {
 public:
  /// Absent for a length that no calendar can hold: not a number, infinite, or beyond all dates.
  [[nodiscard]] std::optional<std::string> string(TimeInterval interval) const;
};

}  // namespace Varnel::Platform
