// SPDX-License-Identifier: MIT
#pragma once

#include <chrono>
#include <string>

#include <orvane/Console.h>
#include <orvane/StandardStreams.h>

namespace Orvane {

/// The status line of work that goes on in many small steps: on a terminal, ten times a second at
/// most, and until the object goes.
///
///     PeriodicStatus status(console);
///     while (step()) status.show([&] { return std::to_string(done) + " files"; });
class PeriodicStatus final {
 public:
  explicit PeriodicStatus(Console& console)
      : console_(console), isShown_(isStandardErrorATerminal()) {}
  ~PeriodicStatus() { console_.clearStatus(); }
  PeriodicStatus(const PeriodicStatus&) = delete;
  PeriodicStatus& operator=(const PeriodicStatus&) = delete;

  template <typename Text>
  void show(const Text& text) {
    if (!isShown_ || Clock::now() < next_) return;
    console_.showStatus(text());
    next_ = Clock::now() + std::chrono::milliseconds(100);
  }

 private:
  using Clock = std::chrono::steady_clock;

  Console& console_;
  const bool isShown_;
  Clock::time_point next_ = Clock::now();
};

}  // namespace Orvane
