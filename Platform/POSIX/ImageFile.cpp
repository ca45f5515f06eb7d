// SPDX-License-Identifier: MIT
#include <Varnel/Platform/POSIX/ImageFile.h>

#include <dlfcn.h>

#include <charconv>
#include <cstdint>
#include <fstream>
#include <string>
#include <system_error>

namespace Varnel::Platform::POSIX {
namespace {

namespace fs = std::filesystem;

fs::path fileMappedAt(std::uintptr_t address) {
  std::ifstream maps("/proc/self/maps");
  for (std::string line; std::getline(maps, line);) {
    std::uintptr_t begin = 0;
    std::uintptr_t end = 0;
    const char* const last = line.data() + line.size();
    const auto [dash, failed] = std::from_chars(line.data(), last, begin, 16);
    if (failed != std::errc() || dash == last) continue;
    if (std::from_chars(dash + 1, last, end, 16).ec != std::errc()) continue;
    if (address < begin || address >= end) continue;
    const std::size_t path = line.find('/');
    return path == std::string::npos ? fs::path() : fs::path(line.substr(path));
  }
  return {};
}

}  // namespace

fs::path imageFile(const void* address) {
  // The loader names a program as it was called, and a library by the folder in which it was looked
  // for: a relative one of these leads elsewhere once the process has changed its folder.
  Dl_info image{};
  if (::dladdr(address, &image) != 0 && image.dli_fname && *image.dli_fname == '/') {
    std::error_code failed;
    fs::path path = fs::canonical(image.dli_fname, failed);
    if (!failed) return path;
  }
  return fileMappedAt(reinterpret_cast<std::uintptr_t>(address));
}

}  // namespace Varnel::Platform::POSIX
