// SPDX-License-Identifier: MIT
#include <Platform/POSIX/Modules.h>

#include <dlfcn.h>

#include <array>
#include <filesystem>

namespace Varnel::Platform::POSIX {
namespace {

namespace fs = std::filesystem;

// The folder of the file that this code was loaded from: the library, or the program that the
// library is a part of.
fs::path ownFolder() {
  Dl_info image{};
  if (::dladdr(reinterpret_cast<const void*>(&ownFolder), &image) == 0 || !image.dli_fname)
    return {};
  std::error_code failed;
  return fs::canonical(image.dli_fname, failed).parent_path();
}

}  // namespace

void* moduleFunction(const char* module, const char* symbol) {
  const fs::path folder = ownFolder();
  const std::array candidates = {
      folder / VARNEL_VERSIONED_NAME / module,
      folder.parent_path() / VARNEL_LIB_FOLDER / module,
  };
  for (const fs::path& candidate : candidates) {
    std::error_code failed;
    if (!fs::exists(candidate, failed)) continue;
    void* const loaded = ::dlopen(candidate.c_str(), RTLD_NOW | RTLD_LOCAL);
    return loaded ? ::dlsym(loaded, symbol) : nullptr;
  }
  return nullptr;
}

}  // namespace Varnel::Platform::POSIX
