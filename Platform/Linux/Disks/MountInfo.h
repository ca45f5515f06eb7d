// SPDX-License-Identifier: MIT
#pragma once

#include <string>
#include <string_view>
#include <vector>

namespace Varnel::Platform::Linux {

/// One line of the kernel's mount table.
struct Mount {
  int id = 0;
  int parentID = 0;
  std::string device;  ///< "8:1"; the first number is 0 for file systems without a device.
  std::string target;  ///< The folder it is mounted on, absolute.
  std::string type;    ///< "ext4", "fuse.sshfs".
  std::string source;  ///< What it was mounted from: "/dev/sda1", "host:/export", anything.

  bool operator==(const Mount&) const = default;
};

/// Reads the bytes of /proc/self/mountinfo. Lines that are not of its form are left out, and so are
/// mounts whose folder was deleted.
[[nodiscard]] std::vector<Mount> parseMountInfo(std::string_view bytes);

/// The mounts that a path can lead to, in their order: none that another one was mounted over.
[[nodiscard]] std::vector<Mount> reachableMounts(const std::vector<Mount>& mounts);

}  // namespace Varnel::Platform::Linux
