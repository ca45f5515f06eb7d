// SPDX-License-Identifier: MIT
#pragma once

#include <string>

#include <Varnel/Platform/Values/Result.h>

namespace Varnel::Platform::POSIX {

inline constexpr const char* moduleIsMissing = "was not built or is not installed";

/// Whether the file of a module is there. Quick.
[[nodiscard]] bool hasModule(const char* module);

/// Why a module cannot be used, as the end of a sentence that begins with the module.
struct ModuleProblem final {
  std::string text;
};

/// The function `symbol` of one of the framework's modules ("libvarnel-curl.so"), which lie in the
/// folder "varnel-VERSION" beside the library. A module is loaded by the first call and stays
/// loaded.
[[nodiscard]] Result<void*, ModuleProblem> moduleFunction(const char* module, const char* symbol);

}  // namespace Varnel::Platform::POSIX
