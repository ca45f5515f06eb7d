// SPDX-License-Identifier: MIT
#pragma once

#include <gtest/gtest.h>
#include <sys/wait.h>
#include <unistd.h>

#include <filesystem>
#include <functional>
#include <vector>

#include <Tests/Support/MountNamespace.h>

namespace Varnel::Tests {

/// Everybody a test can be: itself and, where that is root, an ordinary user as well.
inline std::vector<uid_t> users() {
  constexpr uid_t ordinary = 65534;
  if (::geteuid() == 0) return {0, ordinary};
  return {::geteuid()};
}

/// Lets the user own what lies there.
inline void give(const std::filesystem::path& path, uid_t user) {
  EXPECT_EQ(::lchown(path.c_str(), user, static_cast<gid_t>(-1)), 0) << path;
}

/// Does the rest of a test in a process of its own, as this user; its failures are the test's. With
/// a disk, that folder is an empty file system of the user's in memory meanwhile; false where this
/// machine grants none, and then nothing was done. To be called while this process has one thread.
inline bool inChild(uid_t user, const std::function<void()>& act,
                    const std::filesystem::path& disk = {}) {
  constexpr int noDisk = 77;
  const uid_t self = ::geteuid();
  const pid_t child = ::fork();
  if (child == 0) {
    if (!disk.empty()) {
      if (!enterMountNamespace(self).empty() || !mountMemory(disk)) ::_exit(noDisk);
      std::filesystem::permissions(disk, std::filesystem::perms::owner_all);
      if (user != self) give(disk, user);
      if (self != 0 && !dropCapabilities()) ::_exit(2);
    }
    if (user != self && (::setgid(user) != 0 || ::setuid(user) != 0)) ::_exit(2);
    act();
    ::_exit(testing::Test::HasFailure() ? 1 : 0);
  }
  int status = 0;
  ::waitpid(child, &status, 0);
  const int answer = WIFEXITED(status) ? WEXITSTATUS(status) : -1;
  EXPECT_TRUE(answer == 0 || answer == noDisk) << "in a process of user " << user;
  return answer != noDisk;
}

}  // namespace Varnel::Tests
