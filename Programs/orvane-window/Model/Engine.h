// SPDX-License-Identifier: MIT
#pragma once

#include <atomic>
#include <cstdint>
#include <memory>
#include <set>
#include <string>
#include <utility>
#include <vector>

#include <Removal/Removal.h>
#include <Removal/Report.h>
#include <Removal/Restoration.h>
#include <Removal/Selection.h>
#include <Scan/ScanObserver.h>
#include <Scan/ScanRequest.h>
#include <Scan/ScanResult.h>
#include <orvane-window/Model/FileExport.h>

namespace Orvane {

/// How far a removal or a restoration is, which any thread may read, and the wish to stop it.
struct MoveProgress {
  std::atomic<bool> shouldStop{false};
  std::atomic<std::uint64_t> done{0};
  std::atomic<std::uint64_t> all{0};
};

/// What a scan has found, for a window.
struct ScanOutcome {
  std::vector<LostPath> lostFolders{};  ///< Of those to scan. With any there is nothing else.
  std::shared_ptr<const Report> report{};
  ScanTotals totals{};
  TextSource jsonReport{};  ///< As `orvane scan --json` prints it.

  /// Files that were found and could not be looked at.
  [[nodiscard]] std::uint64_t leftOutFiles() const {
    return totals.unreadableFiles + totals.vanishedFiles + totals.changedFiles;
  }

  /// Files that were found, and could be and were looked at.
  [[nodiscard]] std::uint64_t lookedAtFiles() const {
    return totals.files - leftOutFiles() - totals.unreachedFiles;
  }
};

/// What has become of the files that were to be moved.
struct MoveOutcome {
  struct Left {
    std::string path;
    std::string reason;  ///< For the user.
  };

  std::set<std::string> paths{};  ///< Those that were moved.
  std::uint64_t bytes = 0;
  std::vector<Left> left{};  ///< Those that were to be, and were not.
  std::string problem{};     ///< What was in the way of all of them, for the user.
};

/// A removal that the user is asked about. It is carried out once at most.
class PlannedRemoval {
 public:
  virtual ~PlannedRemoval() = default;

  /// What was in the way of it, for the user; then there is nothing else.
  [[nodiscard]] virtual const std::string& problem() const = 0;
  [[nodiscard]] virtual std::uint64_t files() const = 0;
  [[nodiscard]] virtual std::uint64_t bytes() const = 0;
  /// The trash folders that the files go to.
  [[nodiscard]] virtual const std::set<std::string>& destinations() const = 0;
  /// How many of the chosen files stay where they are, and why.
  [[nodiscard]] virtual std::vector<MoveOutcome::Left> left() const = 0;

  /// Its progress is the one that it was planned with.
  [[nodiscard]] virtual MoveOutcome carryOut() = 0;
};

/// The work behind the window. Each call takes its time: one thread at a time, and not the main
/// one.
class Engine {
 public:
  virtual ~Engine() = default;

  /// Once `control` asks to stop, the report is partial.
  [[nodiscard]] virtual ScanOutcome scan(ScanRequest request, ScanControl& control) = 0;

  /// Whether a file may be gone at any moment, because it is in a trash. Fast; any thread.
  [[nodiscard]] virtual bool isPassing(const std::string& path) const = 0;

  /// Looks at what is to be moved, and moves nothing.
  [[nodiscard]] virtual std::shared_ptr<PlannedRemoval> plan(
      std::shared_ptr<const Report> report, Selection selection,
      std::shared_ptr<MoveProgress> progress) = 0;

  /// Puts back what the last removal has moved.
  [[nodiscard]] virtual MoveOutcome restore(MoveProgress& progress) = 0;
};

}  // namespace Orvane
