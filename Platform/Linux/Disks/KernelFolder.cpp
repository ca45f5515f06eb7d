// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Linux/Disks/KernelFolder.h>

#include <dirent.h>
#include <fcntl.h>
#include <unistd.h>

#include <algorithm>
#include <array>

#include <Varnel/Platform/Values/UniqueHandle.h>

namespace Varnel::Platform::Linux {
namespace {

using Listing = UniqueHandle<DIR*, ::closedir>;
using POSIX::FileDescriptor;

bool isBlank(char c) {
  return static_cast<unsigned char>(c) <= ' ';
}

}  // namespace

KernelFolder::KernelFolder(const char* path)
    : folder_(::open(path, O_RDONLY | O_DIRECTORY | O_CLOEXEC)) {}

std::vector<std::string> KernelFolder::names(const std::string& folder) const {
  FileDescriptor opened(
      ::openat(folder_.get(), folder.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC));
  if (!opened) return {};
  const Listing listing(::fdopendir(opened.get()));
  if (!listing) return {};
  static_cast<void>(opened.release());  // the listing closes it
  std::vector<std::string> result;
  while (const dirent* entry = ::readdir(listing.get()))
    if (entry->d_name[0] != '.') result.emplace_back(entry->d_name);
  std::sort(result.begin(), result.end());
  return result;
}

std::optional<std::string> KernelFolder::link(const std::string& path) const {
  std::array<char, 4096> buffer;
  const ssize_t size = ::readlinkat(folder_.get(), path.c_str(), buffer.data(), buffer.size());
  if (size < 0) return std::nullopt;
  return std::string(buffer.data(), static_cast<std::size_t>(size));
}

std::optional<std::string> KernelFolder::bytes(const std::string& path) const {
  const FileDescriptor file(::openat(folder_.get(), path.c_str(), O_RDONLY | O_CLOEXEC));
  if (!file) return std::nullopt;
  std::array<char, 4096> buffer;
  const ssize_t size = ::read(file.get(), buffer.data(), buffer.size());
  if (size < 0) return std::nullopt;
  return std::string(buffer.data(), static_cast<std::size_t>(size));
}

bool KernelFolder::contains(const std::string& path) const {
  return ::faccessat(folder_.get(), path.c_str(), F_OK, 0) == 0;
}

std::string trimmed(std::string_view text) {
  while (!text.empty() && isBlank(text.front())) text.remove_prefix(1);
  while (!text.empty() && isBlank(text.back())) text.remove_suffix(1);
  return std::string(text);
}

}  // namespace Varnel::Platform::Linux
