// SPDX-License-Identifier: MIT
#pragma once

namespace Varnel::Platform::POSIX {

/// Whether the file of a module is there. Quick.
[[nodiscard]] bool hasModule(const char* module);

/// The function `symbol` of one of the framework's modules ("libvarnel-curl.so"), which lie in the
/// folder "varnel-VERSION" beside the library, or null when the module is missing or does not load.
/// A module is loaded by the first call and stays loaded.
[[nodiscard]] void* moduleFunction(const char* module, const char* symbol);

}  // namespace Varnel::Platform::POSIX
