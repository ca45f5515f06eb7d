// SPDX-License-Identifier: MIT
#pragma once

#include <chrono>
#include <cstddef>
#include <cstdint>
#include <string>
#include <vector>

struct _GPollFD;

namespace Orvane {

/// Measures the turns of the main loop: from one wait for events to the next. What a turn takes of
/// the processor is what the program costs the user's patience; on a busy machine its time on the
/// wall is longer. One at a time; main thread.
class TurnTimes final {
 public:
  TurnTimes();
  ~TurnTimes();
  TurnTimes(const TurnTimes&) = delete;
  TurnTimes& operator=(const TurnTimes&) = delete;

  /// What follows is another phase. Anything may call this, also where nothing is measured.
  static void beginPhase(const std::string& name);

  /// For each phase "scan: 1234 turns; the longest: 12.3 ms of the processor (1 above 50 ms), 20.1
  /// ms on the wall".
  [[nodiscard]] std::string text() const;

 private:
  using Time = std::chrono::nanoseconds;
  struct Moment {
    Time processor{};
    Time wall{};
  };
  struct Phase {
    std::string name;
    std::uint64_t turns = 0;
    std::uint64_t longTurns = 0;
    Moment longest{};
  };

  [[nodiscard]] static Moment now();
  void endTurn();
  void beginTurn();

  static int poll(_GPollFD* descriptors, unsigned count, int timeout);

  Moment begin_ = now();
  std::vector<Phase> phases_{{"start"}};
  std::size_t phaseOfTurn_ = 0;  ///< A turn counts for the phase that it begins in.
};

}  // namespace Orvane
