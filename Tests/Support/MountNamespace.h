// SPDX-License-Identifier: MIT
#pragma once

#include <sched.h>
#include <sys/mount.h>
#include <unistd.h>

#include <cerrno>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <string>

namespace Varnel::Tests {

/// Gives this process a namespace of its own, as of CLONE_NEWNET, also where it is not root: then
/// it becomes the root of a user namespace. To be called before the process has further threads.
/// Returns the reason why it cannot be done, or nothing.
[[nodiscard]] inline std::string enterNamespace(int kind) {
  const uid_t user = ::geteuid();
  const gid_t group = ::getegid();
  if (::unshare(kind) == 0) return {};
  if (::unshare(CLONE_NEWUSER | kind) != 0)
    return std::string("no namespace of its own: ") + std::strerror(errno);
  std::ofstream("/proc/self/setgroups") << "deny";
  std::ofstream("/proc/self/uid_map") << "0 " << user << " 1";
  std::ofstream("/proc/self/gid_map") << "0 " << group << " 1";
  return {};
}

/// The same for mounts, which no other process sees and which go away with this one.
[[nodiscard]] inline std::string enterMountNamespace() {
  if (std::string reason = enterNamespace(CLONE_NEWNS); !reason.empty()) return reason;
  if (::mount("none", "/", nullptr, MS_REC | MS_PRIVATE, nullptr) != 0)
    return std::string("mounts stay shared: ") + std::strerror(errno);
  return {};
}

/// Mounts an empty file system in memory on a folder.
[[nodiscard]] inline bool mountMemory(const std::filesystem::path& folder) {
  return ::mount("varnel-test", folder.c_str(), "tmpfs", 0, "size=1m") == 0;
}

}  // namespace Varnel::Tests
