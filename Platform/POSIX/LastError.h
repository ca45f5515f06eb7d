// SPDX-License-Identifier: MIT
#pragma once

#include <cerrno>
#include <system_error>

namespace Varnel::Platform::POSIX {

/// What stopped the system call just made.
[[nodiscard]] inline std::error_code lastError() {
  return {errno, std::generic_category()};
}

}  // namespace Varnel::Platform::POSIX
