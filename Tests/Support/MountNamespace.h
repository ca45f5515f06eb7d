// SPDX-License-Identifier: MIT
#pragma once

#include <linux/capability.h>
#include <sched.h>
#include <sys/mount.h>
#include <sys/syscall.h>
#include <unistd.h>

#include <cerrno>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <string>

namespace Varnel::Tests {

/// Gives this process mounts of its own, which no other process sees and which go away with it,
/// also where it is not root: then it becomes the root of a user namespace, or another user there.
/// To be called before the process has further threads. Returns the reason why it cannot be done,
/// or nothing.
[[nodiscard]] inline std::string enterMountNamespace(uid_t inside = 0) {
  const uid_t user = ::geteuid();
  const gid_t group = ::getegid();
  if (::unshare(CLONE_NEWNS) != 0) {
    if (::unshare(CLONE_NEWUSER | CLONE_NEWNS) != 0)
      return std::string("no namespace of its own: ") + std::strerror(errno);
    std::ofstream("/proc/self/setgroups") << "deny";
    std::ofstream("/proc/self/uid_map") << inside << " " << user << " 1";
    std::ofstream("/proc/self/gid_map") << "0 " << group << " 1";
  }
  if (::mount("none", "/", nullptr, MS_REC | MS_PRIVATE, nullptr) != 0)
    return std::string("mounts stay shared: ") + std::strerror(errno);
  return {};
}

/// An ordinary user has none; who made a user namespace has all of them there.
[[nodiscard]] inline bool dropCapabilities() {
  __user_cap_header_struct header{.version = _LINUX_CAPABILITY_VERSION_3, .pid = 0};
  const __user_cap_data_struct none[_LINUX_CAPABILITY_U32S_3]{};
  return ::syscall(SYS_capset, &header, none) == 0;
}

/// Mounts an empty file system in memory on a folder.
[[nodiscard]] inline bool mountMemory(const std::filesystem::path& folder) {
  return ::mount("varnel-test", folder.c_str(), "tmpfs", 0, "size=1m") == 0;
}

}  // namespace Varnel::Tests
