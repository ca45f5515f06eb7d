// SPDX-License-Identifier: MIT
#pragma once

#include <functional>
#include <memory>
#include <mutex>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include <Varnel/Platform/POSIX/FileDescriptor.h>
#include <Varnel/Platform/Values/URL.h>

namespace Varnel::Platform::Linux {

/// A mounted file system that holds somebody's files.
struct Volume {
  int mountID = 0;
  std::string device;  ///< As in `Mount`.
  std::string type;
  URL url;
  std::vector<std::string> deviceNames;  ///< The block devices it lies on, if any: "sda1".
  std::optional<bool> isInternal;

  [[nodiscard]] bool isSameMount(const Volume& other) const {
    return mountID == other.mountID && device == other.device && url == other.url;
  }
};

/// The volumes at one moment, all in the order of the mount table. Immutable.
struct VolumeTable {
  std::vector<Volume> volumes;
  std::vector<URL> pseudoFileSystems;  ///< Where the kernel's own are mounted.
  std::vector<std::size_t> byMountID;  ///< Positions in `volumes`, by rising mount id.

  [[nodiscard]] const Volume* withMountID(int mountID) const;
};

/// The process's view of the mount table, which is read again only when the kernel has changed it.
/// Any thread; no call touches a mounted file system.
class MountTable final {
 public:
  MountTable();
  ~MountTable();
  MountTable(const MountTable&) = delete;
  MountTable& operator=(const MountTable&) = delete;

  /// The volumes as they are now. Null when there is no mount table to be read.
  [[nodiscard]] std::shared_ptr<const VolumeTable> current();

 private:
  [[nodiscard]] bool hasChanged() const;

  std::mutex mutex_;  ///< Owns the rest.
  POSIX::FileDescriptor file_;
  bool isStale_ = true;
  std::string buffer_;  ///< Kept for its capacity.
  std::shared_ptr<const VolumeTable> table_;
};

/// Opens the kernel's mount table. A change wakes a poll for exceptional conditions.
[[nodiscard]] POSIX::FileDescriptor openMountInfo();

/// Reads one of the kernel's files from its beginning into the buffer, in place of what it held.
[[nodiscard]] bool readWhole(const POSIX::FileDescriptor& file, std::string& buffer);

}  // namespace Varnel::Platform::Linux
