// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Linux/Trash/HeldFolder.h>

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cstdio>
#include <utility>

#include <Varnel/Platform/Linux/Disks/MountID.h>
#include <Varnel/Platform/POSIX/LastError.h>
#include <Varnel/Platform/Values/SystemText.h>

namespace Varnel::Platform::Linux {
namespace {

using POSIX::FileDescriptor;
using POSIX::lastError;

constexpr int look = O_PATH | O_DIRECTORY | O_NOFOLLOW | O_CLOEXEC;

// Whatever mask of modes the host has: its user could not enter the folder.
void make(int parent, const std::string& name) {
  if (::mkdirat(parent, name.c_str(), S_IRWXU) != 0) return;
  [[maybe_unused]] const int failed =
      ::fchmodat(parent, name.c_str(), S_IRWXU, AT_SYMLINK_NOFOLLOW);
}

FileDescriptor step(int parent, const std::string& name, Missing missing) {
  FileDescriptor next(::openat(parent, name.c_str(), look));
  if (next || errno != ENOENT || missing == Missing::fails) return next;
  make(parent, name);
  return FileDescriptor(::openat(parent, name.c_str(), look));
}

}  // namespace

Result<HeldFolder, std::error_code> HeldFolder::open(std::string_view path, Missing missing) {
  if (!path.starts_with('/') || isCutShort(path))
    return std::make_error_code(std::errc::invalid_argument);
  HeldFolder held{
      .folder = FileDescriptor(::open("/", look)), .path = {}, .volume = {}, .volumePath = {}};
  for (std::string name;;) {
    if (!held.folder) return lastError();
    const auto mount = mountIDOf(held.folder.get());
    if (!mount) return std::make_error_code(std::errc::not_supported);
    if (!held.volume || *mount != held.mount) {
      held.mount = *mount;
      held.volume = FileDescriptor(::openat(held.folder.get(), ".", look));
      held.volumePath = held.path;
      if (!held.volume) return lastError();
    }
    do {
      path.remove_prefix(std::min(path.find_first_not_of('/'), path.size()));
      if (path.empty()) return held;
      name = path.substr(0, path.find('/'));
      path.remove_prefix(name.size());
    } while (name == ".");
    if (name == "..") return std::make_error_code(std::errc::invalid_argument);
    held.folder = step(held.folder.get(), name, missing);
    held.path += "/" + name;
  }
}

std::optional<FileState> stateAt(int folder, const std::string& name) {
  struct stat facts {};
  if (::fstatat(folder, name.c_str(), &facts, AT_SYMLINK_NOFOLLOW | AT_NO_AUTOMOUNT) != 0 ||
      !S_ISREG(facts.st_mode))
    return std::nullopt;
  return FileState{.device = facts.st_dev,
                   .inode = facts.st_ino,
                   .size = static_cast<std::uint64_t>(facts.st_size),
                   .modified = facts.st_mtim.tv_sec,
                   .nanoseconds = static_cast<std::int32_t>(facts.st_mtim.tv_nsec)};
}

Result<FileDescriptor, std::error_code> openOwn(int parent, const std::string& name,
                                                Missing missing) {
  const auto open = [&] {
    return FileDescriptor(
        ::openat(parent, name.c_str(), O_RDONLY | O_DIRECTORY | O_NOFOLLOW | O_CLOEXEC));
  };
  FileDescriptor folder = open();
  if (!folder && errno == ENOENT && missing == Missing::isMade) {
    make(parent, name);
    const int failure = errno;
    folder = open();
    if (!folder && errno == ENOENT) errno = failure;
  }
  struct stat facts {};
  if (!folder || ::fstat(folder.get(), &facts) != 0) return lastError();
  if (facts.st_uid != ::geteuid()) return std::make_error_code(std::errc::operation_not_permitted);
  return folder;
}

std::error_code moveAside(int from, const std::string& name, int to, const std::string& newName) {
  if (::renameat2(from, name.c_str(), to, newName.c_str(), RENAME_NOREPLACE) == 0) return {};
  return lastError();
}

}  // namespace Varnel::Platform::Linux
