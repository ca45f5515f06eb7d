// SPDX-License-Identifier: MIT
#pragma once

#include <cstddef>

namespace Varnel::Benchmarks {

/// How often the program has allocated so far, on all threads. Linking it makes the program count.
[[nodiscard]] std::size_t allocationCount();

}  // namespace Varnel::Benchmarks
