// SPDX-License-Identifier: MIT
#include <Varnel/Basalt/FuzzyByteCountFormatter.h>

#include <algorithm>
#include <limits>

namespace Basalt {

using Varnel::Platform::ByteCountStyle;

namespace {

constexpr std::uint64_t factors[] = {1, 2, 5, 10, 20, 50, 100, 200, 500};

std::uint64_t roundedUp(std::uint64_t bytes, std::uint64_t unitStep) {
  std::uint64_t unit = unitStep;
  while (bytes / unit >= unitStep) unit *= unitStep;
  for (const std::uint64_t factor : factors)
    if (bytes <= factor * unit) return factor * unit;
  return unitStep * unit;
}

}  // namespace

FuzzyByteCountFormatter::FuzzyByteCountFormatter(std::string_view localeIdentifier)
    : formatter_(localeIdentifier) {}

std::string FuzzyByteCountFormatter::string(std::int64_t count, ByteCountStyle style) const {
  if (count == 0) return formatter_.string(0, style);
  // Negated as unsigned, because the lowest count has no positive counterpart.
  const auto bits = static_cast<std::uint64_t>(count);
  constexpr std::uint64_t greatest = std::numeric_limits<std::int64_t>::max();
  const std::uint64_t rounded = roundedUp(count < 0 ? 0 - bits : bits, unitStep(style));
  const auto coarse = static_cast<std::int64_t>(std::min(rounded, greatest));
  return formatter_.string(count < 0 ? -coarse : coarse, style);
}

}  // namespace Basalt
