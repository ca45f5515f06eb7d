// SPDX-License-Identifier: MIT
#pragma once

#include <array>
#include <chrono>
#include <cstddef>
#include <cstdint>
#include <memory>
#include <string>
#include <vector>

#include <Varnel/Basalt/ThreadID.h>
#include <Varnel/DiskAccess/OVDiskInfo.h>

namespace Varnel {

/// Who was on a disk at a moment, and who waited for it. See `DiskAccessManager::snapshots`.
///
///     for (const DiskAccessSnapshot& disk : manager.snapshots())
///       for (const auto& place : disk.places) print(place.propose, now - place.since);
struct DiskAccessSnapshot {
  using Time = std::chrono::steady_clock::time_point;

  /// A session that has not been ended, even one that was dropped.
  struct Place {
    Basalt::ThreadID thread;
    std::string propose;  ///< What the access is for. (The name is published so.)
    Time since;

    bool operator==(const Place&) const = default;
  };

  /// How many threads wait, the most urgent class first: user-interactive, user-initiated and
  /// default, utility, background.
  using Waiters = std::array<std::size_t, 4>;

  std::shared_ptr<const OVDiskInfo> disk;
  std::int64_t maxReaders = 0;  ///< Now: one in background mode.
  std::vector<Place> places{};  ///< In the order in which they were taken.
  Waiters waiters{};
  /// Those that wait for a place which another process has, see `DiskReadingQueue::Ports`.
  Waiters waitersForProcesses{};
};

}  // namespace Varnel
