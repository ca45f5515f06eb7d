// SPDX-License-Identifier: MIT
#pragma once

#include <atomic>
#include <cstddef>
#include <cstdint>
#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <system_error>
#include <vector>

#include <Removal/Report.h>
#include <Scan/FileSystem.h>

namespace Varnel {
class DiskAccessManager;
}

namespace Orvane {

/// One file of a group: what became of it.
struct SharingStep {
  enum class Outcome {
    source,          ///< Others take its extents; or there was nothing that it could take.
    planned,         ///< In a trial: it can be shared.
    shared,          ///< Its content lies where that of another file does.
    alreadyShared,   ///< So it did before.
    withoutExtents,  ///< It is so small, or so empty, that there is nothing to share.
    // Left as it was because of what was met:
    onOtherFileSystem,  ///< All that is on its file system is different, or a reference.
    unsupported,        ///< Its file system cannot share extents.
    readOnly,           ///< It is on a volume that is mounted read-only.
    notPermitted,       ///< The user may not change it.
    changed,            ///< It is not what the report tells, or not there.
    different,          ///< Its content is not that of the others.
    unreadable,         ///< It cannot be read.
    noAccess,           ///< The framework gives no access to its disk.
    failed,             ///< The system would not do it.
    stopped,            ///< The sharing was stopped before it, or in its middle.
  };

  std::size_t group = 0;  ///< In the report.
  std::size_t file = 0;   ///< In the group.
  Outcome outcome = Outcome::stopped;
  std::error_code code{};        ///< What the system has said, where the outcome does not say it.
  std::uint64_t freedBytes = 0;  ///< What it held alone and no longer holds; in a trial, would not.
};

/// The figures of a sharing.
struct SharingTotals {
  std::uint64_t planned = 0;  ///< Files, as the next three.
  std::uint64_t shared = 0;
  std::uint64_t alreadyShared = 0;
  std::uint64_t notShared = 0;   ///< Left as they were because of what was met.
  std::uint64_t freedBytes = 0;  ///< As far as the file systems tell.
  bool isSupported = true;       ///< False when no file system of the files can share extents.
};

/// Lets the files of each group of a report lie in the same place of their disk. The system itself
/// compares them and leaves alone what differs, so that no content is ever lost; times stay. A file
/// takes the extents of a reference on its file system or, without one, of the first file there. A
/// reference is never changed.
///
///     Sharing sharing(ports, report, Sharing::Mode::real, shouldStop);
///     while (const SharingStep* step = sharing.next()) show(*step);
///     if (sharing.totals().notShared > 0) …
///
/// One thread at a time; calls wait for disks.
class Sharing final {
 public:
  /// A trial asks the system what it would do, and compares and changes nothing.
  enum class Mode { trial, real };

  /// All outlive the sharing.
  struct Ports {
    FileSystem& fileSystem;
    Varnel::DiskAccessManager& disks;
  };

  /// Report and flag outlive the sharing. Once the flag is set, `next` returns soon: parts are of
  /// 16 MB.
  Sharing(Ports ports, const Report& report, Mode mode, const std::atomic<bool>& shouldStop);
  Sharing(const Sharing&) = delete;
  Sharing& operator=(const Sharing&) = delete;

  /// By groups; the references of each come first.
  [[nodiscard]] const std::vector<SharingStep>& steps() const { return steps_; }
  [[nodiscard]] const std::string& pathOf(const SharingStep& step) const;
  /// Of each file in its group, in bytes.
  [[nodiscard]] std::uint64_t sizeOf(const SharingStep& step) const;

  /// Makes the next step and returns it; null when none is left, or the flag is set. Calls
  /// `didShare` after each part of the file.
  [[nodiscard]] const SharingStep* next(const std::function<void()>& didShare = [] {});

  /// How many steps are made, and how many bytes are compared by now.
  [[nodiscard]] std::size_t countMade() const { return nextStep_; }
  [[nodiscard]] std::uint64_t comparedBytes() const { return comparedBytes_; }
  [[nodiscard]] SharingTotals totals() const;

 private:
  /// A file that was as reported when it was opened.
  struct Source {
    const std::string* path;
    std::unique_ptr<OpenFile> file;
    FileStatus status;
  };

  /// What a file holds now, as far as the system tells.
  struct Held {
    std::optional<SharedExtents> extents{};
    std::optional<std::uint64_t> ownBytes{};  ///< They go when the file goes.
  };

  [[nodiscard]] const ReportFile& fileOf(const SharingStep& step) const;
  [[nodiscard]] Source open(SharingStep& step);
  [[nodiscard]] Held heldBy(const Source& source);
  void share(SharingStep& step, const Source& file, const Source& source,
             const std::function<void()>& didShare);
  void shareParts(SharingStep& step, const Source& file, const Source& source,
                  const std::function<void()>& didShare);

  const Ports ports_;
  const Report& report_;
  const Mode mode_;
  const std::atomic<bool>& shouldStop_;
  std::vector<SharingStep> steps_;
  std::size_t nextStep_ = 0;
  std::vector<Source> sources_;  ///< Of the group at hand, one a device.
  std::uint64_t comparedBytes_ = 0;
};

}  // namespace Orvane
