// SPDX-License-Identifier: MIT
#pragma once

#include <chrono>

namespace Varnel::Platform {

/// A moment of the wall clock, in microseconds since 1970-01-01 UTC. Unlike the nanosecond clock it
/// spans some 292,000 years either way, so that "in a thousand years" is a date like any other.
using Date = std::chrono::sys_time<std::chrono::microseconds>;

/// A length of time in seconds, with fractions; the unit in which time-outs and timings are given.
using TimeInterval = double;

/// The length from `start` to `end` in seconds, negative when `end` lies before `start`.
[[nodiscard]] inline TimeInterval intervalBetween(Date start, Date end) {
  return std::chrono::duration<double>(end - start).count();
}

}  // namespace Varnel::Platform
