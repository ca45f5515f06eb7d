// SPDX-License-Identifier: MIT
#pragma once

#include <atomic>
#include <cstddef>
#include <functional>
#include <vector>

namespace Orvane {

/// Runs `work` once on each of `count` threads, the caller's among them, and waits for all. When
/// calls throw, one of their exceptions is thrown on after the last has ended.
void runOnThreads(unsigned count, const std::function<void(unsigned worker)>& work);

/// Indices from 0 to a count, cut into lanes, for several workers to draw from. Workers begin in
/// different lanes, so that work that is sorted by disk keeps all disks busy.
///
///     WorkLanes lanes({100, 250});  // 0…99 and 100…249
///     while (auto index = lanes.next(worker)) …
class WorkLanes final {
 public:
  /// `ends`: the ascending ends of the lanes.
  explicit WorkLanes(const std::vector<std::size_t>& ends);

  /// Draws an index from the worker's lane or, when that is used up, from the next lanes. False
  /// when all are used up.
  [[nodiscard]] bool next(unsigned worker, std::size_t& index);

 private:
  struct Lane {
    std::atomic<std::size_t> next;
    std::size_t end;
  };

  std::vector<Lane> lanes_;
};

}  // namespace Orvane
