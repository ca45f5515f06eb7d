// SPDX-License-Identifier: MIT
#pragma once

#include <filesystem>

namespace Varnel::Platform::POSIX {

/// The file, by its absolute path, that the code or data at this address was loaded from: a library
/// or the program. Empty when the system does not tell. Any thread.
[[nodiscard]] std::filesystem::path imageFile(const void* address);

}  // namespace Varnel::Platform::POSIX
