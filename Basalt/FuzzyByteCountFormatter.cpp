// SPDX-License-Identifier: MIT
#include <Basalt/FuzzyByteCountFormatter.h>

#include <cstdlib>

namespace Basalt {
namespace {

using Style = Varnel::Platform::ByteCountStyle;

// The distance from zero in units of one step. The quotient keeps its sign until it is small, so
// that the least count needs no positive counterpart.
std::int64_t steps(std::int64_t count, std::int64_t step) {
  return std::abs(count / step);
}

// One KB, ten KB, a hundred KB, one MB, …: the step that leaves one digit of the count.
std::int64_t stepOf(std::int64_t count, std::int64_t unit) {
  std::int64_t step = unit;
  while (steps(count, step) >= unit) step *= unit;
  while (steps(count, step) >= 10) step *= 10;
  return step;
}

}  // namespace

FuzzyByteCountFormatter::FuzzyByteCountFormatter(std::string_view localeIdentifier)
    : exact_(localeIdentifier) {}

std::string FuzzyByteCountFormatter::string(std::int64_t count, Style style) const {
  const std::int64_t unit = style == Style::memory || style == Style::binary ? 1024 : 1000;
  if (count == 0) return exact_.string(0, style);
  if (count / unit == 0) return exact_.string(count < 0 ? -unit : unit, style);
  const std::int64_t step = stepOf(count, unit);
  return exact_.string(count / step * step, style);
}

}  // namespace Basalt
