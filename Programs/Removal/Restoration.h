// SPDX-License-Identifier: MIT
#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>
#include <system_error>
#include <vector>

#include <Removal/RemovalJournal.h>

namespace Varnel {
class DiskAccessManager;
}

namespace Orvane {

/// One file of a removal: what becomes of it when it is put back.
struct RestorationStep {
  enum class Outcome {
    planned,
    restored,
    inPlace,   ///< It was never moved: the removal ended right before.
    emptied,   ///< The trash does not have it any more.
    occupied,  ///< Something else has its place; it stays in the trash.
    noTrash,   ///< Its disk is not there.
    noAccess,  ///< The framework gives no access to its disk.
    failed,    ///< The system would not move it; it stays in the trash.
  };

  RemovalJournal::Entry entry;
  Outcome outcome = Outcome::planned;
  std::error_code code{};
  /// Whether the journal could not note it. It will be tried again next time, which does no harm.
  bool isUnnoted = false;
};

/// Puts the files of one removal back into their places, one at a time. Nothing is ever replaced;
/// folders that are missing are made, for this user alone.
///
///     Restoration restoration(ports, number);
///     if (const auto problem = restoration.begin()) return complain(*problem);
///     while (const RestorationStep* step = restoration.next()) show(*step);
///
/// One thread at a time; calls wait for disks. Ends at any moment without a loss.
class Restoration final {
 public:
  /// All outlive the restoration.
  struct Ports {
    Varnel::DiskAccessManager& disks;
    Varnel::Platform::Trash& trash;
    RemovalJournal& journal;
  };

  /// What is in the way of the whole restoration.
  struct Problem {
    enum class Reason {
      unknown,  ///< There is no such removal, or none at all.
      journal,  ///< The journal cannot be read or written.
      busy,     ///< Another removal or restoration of this user is at work.
    };

    Reason reason = Reason::unknown;
    std::string description{};
  };

  /// Without a number it is the last removal that has something to give back. With one, files that
  /// its trash did not have are looked for again.
  Restoration(Ports ports, std::optional<std::int64_t> number);

  /// Takes the lock, and reads the journal. To be called once, before what follows.
  [[nodiscard]] std::optional<Problem> begin();

  /// The removal that is undone.
  [[nodiscard]] std::int64_t number() const { return record_.number; }
  /// The last file that was moved comes first.
  [[nodiscard]] const std::vector<RestorationStep>& steps() const { return steps_; }

  /// Makes the next step and returns it; null when none is left.
  [[nodiscard]] const RestorationStep* next();

 private:
  const Ports ports_;
  const std::optional<std::int64_t> wanted_;
  RemovalRecord record_;
  RemovalJournal::Lock lock_;
  std::vector<RestorationStep> steps_;
  std::size_t nextStep_ = 0;
};

}  // namespace Orvane
