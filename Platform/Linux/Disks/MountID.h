// SPDX-License-Identifier: MIT
#pragma once

#include <string>

#include <Varnel/Platform/Values/Result.h>

namespace Varnel::Platform::Linux {

/// The mount that a file lies on, by its number in the mount table. For a symbolic link it is the
/// mount of the link itself. Fails when the path cannot be looked up. Any thread.
[[nodiscard]] Result<int> mountIDOf(const std::string& path);
/// The same for an open file.
[[nodiscard]] Result<int> mountIDOf(int descriptor);

}  // namespace Varnel::Platform::Linux
