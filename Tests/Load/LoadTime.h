// SPDX-License-Identifier: MIT
#pragma once

#include <algorithm>
#include <chrono>
#include <cstdlib>

namespace Varnel::Tests {

/// Whether `tools/try-load` runs the test.
inline bool isLongLoad() {
  return std::getenv("VARNEL_LOAD_SECONDS") != nullptr;
}

/// For how long a test puts load on the framework: a second, or what `tools/try-load` says.
inline std::chrono::steady_clock::time_point endOfLoad() {
  const char* seconds = std::getenv("VARNEL_LOAD_SECONDS");
  return std::chrono::steady_clock::now() +
         std::chrono::seconds(seconds ? std::max(std::atoi(seconds), 1) : 1);
}

}  // namespace Varnel::Tests
