// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <vector>

namespace Orvane {

/// A physical disk, as far as a scan must know it.
struct ScanDisk {
  unsigned places = 1;     ///< How many tasks read at once, at least 1.
  bool isOrdered = true;   ///< Whether it reads faster what lies together.
  bool isReadable = true;  ///< No when the framework knows no volume there: content stays unread.
};

/// A file system that is mounted.
struct ScanMount {
  enum class Kind {
    local,
    network,  ///< Its files lie on another machine, which may not answer.
    pseudo,   ///< The kernel shows itself there; nobody's files.
  };

  std::string path;  ///< The folder that it is mounted on, absolute.
  Kind kind = Kind::local;
};

/// The time in which a task may read. One thread at a time.
class DiskTurn {
 public:
  virtual ~DiskTurn() = default;

  /// Whether another reader of the disk should come in now. Cheap enough to be asked at each file.
  [[nodiscard]] virtual bool isOver() = 0;

  /// Counts content that was read.
  virtual void didRead(std::uint64_t bytes) = 0;
};

/// Work that is done in turns at one disk, on one thread at a time.
class DiskTask {
 public:
  virtual ~DiskTask() = default;

  /// Reads until the turn is over or nothing is left, and at least a little. Answers the place on
  /// the disk where the next turn will go on, or nothing when the task is done. Must not throw.
  [[nodiscard]] virtual std::optional<std::uint64_t> run(DiskTurn& turn) = 0;

  /// In place of a turn, the last call: the disk cannot be read any more. Must not throw.
  virtual void refuse() = 0;
};

/// Gives out turns at the disks, so that a scan leaves them to more urgent readers in between. The
/// scan touches a disk only inside them, but to open the folders that it is given. Any thread.
class DiskTurns {
 public:
  virtual ~DiskTurns() = default;

  /// What is mounted where, as far as the system tells. Touches none of it.
  [[nodiscard]] virtual std::vector<ScanMount> mounts() = 0;

  /// The disk that holds the folder or file; the same object for all that lie on one disk. A disk
  /// remains as long as one volume remains that was asked about. Touches nothing when something is
  /// mounted on just that folder; otherwise it may wait for a share that does not answer. Lives as
  /// long as this object.
  [[nodiscard]] virtual const ScanDisk& diskOf(const std::string& path) = 0;

  /// Runs the task, in turns, on a thread of its own choice until it is done, and drops it. Does
  /// not wait. Also called from within a turn.
  virtual void start(const ScanDisk& disk, std::shared_ptr<DiskTask> task) = 0;
};

}  // namespace Orvane
