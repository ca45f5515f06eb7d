// SPDX-License-Identifier: MIT
#pragma once

#include <atomic>
#include <cstddef>
#include <cstdint>
#include <optional>
#include <set>
#include <string>
#include <string_view>
#include <system_error>
#include <vector>

#include <Removal/RemovalJournal.h>
#include <Removal/Report.h>
#include <Removal/Selection.h>
#include <Scan/FreedSpace.h>
#include <Varnel/Platform/Ports/Trash.h>

namespace Varnel {
class DiskAccessManager;
}
namespace Varnel::Platform {
class Clock;
}

namespace Orvane {

class FileSystem;
class PackagedFiles;

/// What is moved only when it is named.
struct Allowances {
  bool hiddenFolders = false;     ///< Files in folders whose names begin with a dot.
  bool otherFileSystems = false;  ///< Files on another file system than the one that stays.
  bool packagedFiles = false;     ///< Files that the package system owns.
  bool hardLinks = false;         ///< All known names of a file that has several.
};

/// One name of a victim: what shall become of it, or became.
struct RemovalStep {
  enum class Outcome {
    planned,
    moved,
    // Left alone because it is not allowed:
    inHiddenFolder,
    onOtherFileSystem,
    packaged,
    hardLinked,
    // Left alone because of what was met:
    inTrash,        ///< It lies in a trash, or the file that would stay does.
    changed,        ///< A file of its group is not what the report tells, or not there.
    different,      ///< It is no copy of the file that stays: it differs, or is that very file.
    unreadable,     ///< It, or the file that stays, cannot be read.
    noAccess,       ///< The framework gives no access to its disk.
    noTrash,        ///< Its file system has no trash, after all.
    notJournalled,  ///< The journal cannot be written.
    failed,         ///< The system would not move it.
    misplaced,      ///< Something else took its place while it was moved, and lies in the trash.
    stopped,        ///< The removal was stopped before.
  };

  std::size_t choice = 0;  ///< In the selection.
  std::size_t file = 0;    ///< In the group.
  std::size_t name = 0;    ///< 0 is its path; above, one of its further names.
  Outcome outcome = Outcome::planned;
  std::error_code code{};        ///< What the system has said, if it did.
  std::uint64_t otherNames = 0;  ///< Hard links that stay. While there are any, nothing is freed.
};

/// The figures of a removal.
struct RemovalTotals {
  std::uint64_t planned = 0;  ///< Names, as all that follow.
  std::uint64_t moved = 0;
  std::uint64_t notAllowed = 0;  ///< Left alone for want of an allowance.
  std::uint64_t notMoved = 0;    ///< Left alone because of what was met.
  /// What is free once the trash is emptied, and what would be if all that is planned were moved:
  /// holes and what other files share do not count, as far as the file system tells.
  std::uint64_t freedBytes = 0;
  std::uint64_t plannedBytes = 0;
};

/// Moves the victims of a selection to the trash, one at a time. Each is compared byte for byte
/// with the file that stays right before, under a session of access to their disks, and is in the
/// journal before it is moved. A group of which any file has changed since the report is left
/// alone.
///
///     Removal removal(ports, report, selection, allowances, shouldStop);
///     if (const auto problem = removal.prepare()) return complain(*problem);
///     show(removal.steps());
///     if (const auto problem = removal.begin()) return complain(*problem);
///     while (const RemovalStep* step = removal.next()) show(*step);
///     if (removal.totals().notMoved > 0) …
///
/// One thread at a time; calls wait for disks. Nothing is lost by ending at any moment.
class Removal final {
 public:
  /// All outlive the removal.
  struct Ports {
    FileSystem& fileSystem;
    Varnel::DiskAccessManager& disks;
    Varnel::Platform::Trash& trash;
    PackagedFiles& packagedFiles;
    RemovalJournal& journal;
    const Varnel::Platform::Clock& clock;
  };

  /// What is in the way of the whole removal, before anything was touched.
  struct Problem {
    enum class Reason {
      selection,  ///< It is none that may be acted on.
      noTrash,    ///< A file system has no trash.
      packages,   ///< What the package system owns cannot be told.
      journal,    ///< The journal cannot be written.
      busy,       ///< Another removal or restoration of this user is at work.
    };

    Reason reason = Reason::selection;
    std::string path{};  ///< A file that shows it.
    std::string description{};
  };

  /// Report, selection and flag outlive the removal. Once the flag is set, `next` returns soon.
  Removal(Ports ports, const Report& report, const Selection& selection, Allowances allowances,
          const std::atomic<bool>& shouldStop);
  Removal(const Removal&) = delete;
  Removal& operator=(const Removal&) = delete;

  /// Looks at every file, and makes the steps: those that cannot be made have their outcome
  /// already. Moves nothing.
  [[nodiscard]] std::optional<Problem> prepare();

  /// In the order of the selection.
  [[nodiscard]] const std::vector<RemovalStep>& steps() const { return steps_; }
  [[nodiscard]] const std::string& pathOf(const RemovalStep& step) const;
  [[nodiscard]] std::uint64_t sizeOf(const RemovalStep& step) const;
  /// The file that stays for it.
  [[nodiscard]] const std::string& keptFor(const RemovalStep& step) const;

  /// Finds a trash for each file, takes the lock and begins an entry of the journal. To be called
  /// once, before `next`.
  [[nodiscard]] std::optional<Problem> begin();

  /// Makes the next planned step and returns it; null when none is left.
  [[nodiscard]] const RemovalStep* next();

  /// By which the journal knows the removal, once it has begun.
  [[nodiscard]] std::int64_t number() const { return record_.number; }
  [[nodiscard]] RemovalTotals totals() const;

 private:
  using Names = std::set<std::string_view>;

  [[nodiscard]] const ReportGroup& groupOf(const RemovalStep& step) const;
  [[nodiscard]] const ReportFile& fileOf(const RemovalStep& step) const;
  [[nodiscard]] bool isAsReported(const Varnel::Platform::FileState& state, const ReportFile& file,
                                  std::uint64_t size) const;
  // From one step to another, of one group:
  void lookAtGroup(std::size_t begin, std::size_t end, const Names& packaged);
  void lookAt(RemovalStep& step, bool isOnFileSystemOfKept, const Names& packaged);
  [[nodiscard]] std::optional<Problem> findTrashes();
  void move(RemovalStep& step);
  void end(std::size_t from, std::size_t to, RemovalStep::Outcome outcome);
  [[nodiscard]] std::uint64_t freedBytes(std::size_t begin, std::size_t end,
                                         const std::set<RemovalStep::Outcome>& leaving) const;

  const Ports ports_;
  const Report& report_;
  const Selection& selection_;
  const Allowances allowances_;
  const std::atomic<bool>& shouldStop_;
  std::vector<RemovalStep> steps_;
  std::vector<std::vector<FileSpace>> spaces_;  ///< Of the files of each choice's group.
  std::size_t nextStep_ = 0;
  RemovalRecord record_;
  RemovalJournal::Lock lock_;
};

}  // namespace Orvane
