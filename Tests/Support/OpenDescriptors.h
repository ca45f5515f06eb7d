// SPDX-License-Identifier: MIT
#pragma once

#include <filesystem>
#include <iterator>

namespace Varnel::Tests {

/// How many file descriptors this process has open, to be compared before and after.
[[nodiscard]] inline std::ptrdiff_t openDescriptors() {
  return std::distance(std::filesystem::directory_iterator("/proc/self/fd"), {});
}

}  // namespace Varnel::Tests
