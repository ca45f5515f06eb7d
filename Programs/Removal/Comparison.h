// SPDX-License-Identifier: MIT
#pragma once

#include <atomic>
#include <string>
#include <system_error>

#include <Scan/FileSystem.h>

namespace Varnel {
class DiskAccessManager;
}

namespace Orvane {

/// How two files compare.
struct Comparison {
  enum class Verdict {
    equal,       ///< Two files, and each byte the same.
    different,   ///< Not so, though neither has changed; or one file seen twice.
    changed,     ///< One of them is not in its state, before or after.
    unreadable,  ///< The system's error says why.
    noAccess,    ///< The framework gives no access to a disk.
    stopped,     ///< The flag was set.
  };

  Verdict verdict = Verdict::equal;
  std::error_code code{};
};

/// A file by its path, and the state that it must be in.
struct ComparedFile {
  const std::string& path;
  FileStatus status;
};

/// Reads both files, in turns of access to their disks, until the first byte that differs. Follows
/// no link. Returns soon once the flag is set.
[[nodiscard]] Comparison compare(const ComparedFile& one, const ComparedFile& other,
                                 FileSystem& fileSystem, Varnel::DiskAccessManager& disks,
                                 const std::atomic<bool>& shouldStop);

/// Whether the file is there, and in its state. It is opened for that: a look-up may tell what the
/// file system remembers of it.
[[nodiscard]] bool isStillThere(const ComparedFile& file, FileSystem& fileSystem);

}  // namespace Orvane
