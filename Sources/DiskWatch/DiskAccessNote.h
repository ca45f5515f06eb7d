// SPDX-License-Identifier: MIT
#pragma once

#include <array>
#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include <Varnel/DiskAccess/DiskAccessSnapshot.h>
#include <Varnel/Platform/Api.h>

namespace Varnel {

/// What a process tells the others of its places on disks, as a text for the session's board.
///
///     board.post(DiskAccessNote("orvane", manager.snapshots(), now).text());
///     …
///     for (const auto& posted : board.notes())
///       if (const auto note = DiskAccessNote::fromText(posted.text)) show(*note);
///
/// A plain value. It names some dozens of places and disks at most, and no purpose at length.
struct VARNEL_API DiskAccessNote {
  struct Place {
    std::string propose;  ///< What the access is for.
    double seconds = 0;   ///< How long it had been held when the note was written.
    bool operator==(const Place&) const = default;
  };
  using Waiters = std::array<std::int64_t, 4>;  ///< As in `DiskAccessSnapshot`.

  struct Disk {
    std::string uniqueID;
    std::string volume;  ///< The path of one of its volumes; empty when none is known.
    std::int64_t maxReaders = 0;
    std::vector<Place> places{};
    Waiters waiters{};
    Waiters waitersForProcesses{};
    bool operator==(const Disk&) const = default;
  };

  DiskAccessNote() = default;
  DiskAccessNote(std::string program, const std::vector<DiskAccessSnapshot>& snapshots,
                 DiskAccessSnapshot::Time now);

  /// Absent when the text is no note. Whoever wrote it, numbers are finite and not negative.
  [[nodiscard]] static std::optional<DiskAccessNote> fromText(std::string_view text);
  [[nodiscard]] std::string text() const;

  bool operator==(const DiskAccessNote&) const = default;

  std::string program;
  std::vector<Disk> disks;
};

}  // namespace Varnel
