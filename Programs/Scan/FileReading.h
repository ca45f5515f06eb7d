// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <mutex>
#include <optional>
#include <set>
#include <utility>
#include <vector>

#include <Scan/Candidate.h>
#include <Scan/ContentReader.h>
#include <Scan/Footprint.h>
#include <Scan/Loss.h>

namespace Orvane {

class DiskTurns;
class FileSystem;
struct ScanControl;
struct ScanDisk;

/// Reads the files of a scan, look by look, in the order that their disks like.
///
/// A disk that is not ordered is read as the files come, by as many tasks as it has places. An
/// ordered one is read from inode to inode at first. That costs nothing while the page cache has
/// what is read; once a turn shows that the disk works for it, the rest is read by physical place,
/// and small files whole, as their heads would cost no less.
///
///     FileReading reading({tree, fileSystem, turns}, control);
///     reading.read(Look::head, candidates);
///
/// One call at a time.
class FileReading final {
 public:
  struct Ports {
    const FileTree& tree;
    FileSystem& fileSystem;
    DiskTurns& turns;
  };
  using Losses = std::vector<std::pair<FileNumber, Loss>>;

  FileReading(Ports ports, ScanControl& control) : ports_(ports), control_(control) {}
  ~FileReading();

  /// Leaves in each candidate's key the digest of what the look shows. Drops those that cannot be
  /// read, and those whose turn did not come because the scan was cancelled.
  void read(Look look, std::vector<Candidate>& candidates);

  /// How many files were dropped because the scan was cancelled.
  [[nodiscard]] std::uint64_t unreachedFiles() const { return unreachedFiles_; }

  /// What was lost since the last call, in no order.
  [[nodiscard]] Losses takeLosses() { return std::exchange(losses_, {}); }

  /// The files that were read to their end and take up other than their size, or have other names;
  /// sorted.
  [[nodiscard]] std::vector<Footprint> takeFootprints();

  /// The digest of the rest, if a look at heads has read it with the head.
  [[nodiscard]] std::optional<Digest> restDigest(FileNumber file) const;

 private:
  class DiskPass;
  using Digests = std::vector<std::pair<FileNumber, Digest>>;

  Ports ports_;
  ScanControl& control_;
  const DigestSecret secret_;
  std::uint64_t unreachedFiles_ = 0;
  std::set<const ScanDisk*> coldDisks_;  ///< Those that were seen to work for what is read.

  std::mutex mutex_;  ///< Guards these while tasks run.
  Losses losses_;
  std::vector<Footprint> footprints_;
  Digests restDigests_;  ///< Sorted when no task runs.
};

}  // namespace Orvane
