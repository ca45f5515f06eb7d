// SPDX-License-Identifier: MIT
#pragma once

#include <cerrno>
#include <system_error>

namespace Varnel::Platform::POSIX {

/// The error of the system call that has just failed.
[[nodiscard]] inline std::error_code lastError() {
  return {errno, std::generic_category()};
}

}  // namespace Varnel::Platform::POSIX
