// SPDX-License-Identifier: MIT
#include <Varnel/Platform/POSIX/Modules.h>

#include <dlfcn.h>

#include <array>
#include <filesystem>

#include <Varnel/Platform/POSIX/ImageFile.h>

namespace Varnel::Platform::POSIX {
namespace {

namespace fs = std::filesystem;

// The file of a module; empty when there is none.
fs::path fileOf(const char* module) {
  // Beside the library, or the program that the library is a part of; never in the current folder.
  const fs::path own = imageFile(reinterpret_cast<const void*>(&fileOf));
  if (own.empty()) return {};
  const fs::path folder = own.parent_path();
  const std::array candidates = {
      folder / VARNEL_VERSIONED_NAME / module,
      folder / VARNEL_LIBRARIES_FROM_PROGRAMS / VARNEL_VERSIONED_NAME / module,
      folder / VARNEL_LIBRARIES_FROM_NOTIFIER / VARNEL_VERSIONED_NAME / module,
  };
  for (const fs::path& candidate : candidates) {
    std::error_code failed;
    if (fs::exists(candidate, failed)) return candidate;
  }
  return {};
}

}  // namespace

bool hasModule(const char* module) {
  return !fileOf(module).empty();
}

Result<void*, ModuleProblem> moduleFunction(const char* module, const char* symbol) {
  const fs::path file = fileOf(module);
  if (file.empty()) return ModuleProblem{moduleIsMissing};
  void* const loaded = ::dlopen(file.c_str(), RTLD_NOW | RTLD_LOCAL);
  if (void* const function = loaded ? ::dlsym(loaded, symbol) : nullptr) return function;
  const char* const error = ::dlerror();
  return ModuleProblem{std::string("does not load: ") + (error ? error : symbol)};
}

}  // namespace Varnel::Platform::POSIX
