// SPDX-License-Identifier: MIT
#pragma once

#include <signal.h>

#include <atomic>
#include <thread>

namespace Orvane {

/// While it lives, the first SIGINT, SIGTERM or SIGHUP sets a flag instead of ending the program; a
/// second one ends it, and leaves no line of progress on the terminal. A thread of its own waits
/// for them: the others may be deep in a file system that does not answer. One object at a time, on
/// the main thread.
///
///     Interruption interruption(control.isCancelled);
///     …
///     if (interruption.signal() != 0) return 128 + interruption.signal();
///
/// What the user waits for with nothing to show yet, as a look-up, comes before it: then the first
/// signal ends the program.
class Interruption final {
 public:
  /// `flag` outlives the object.
  explicit Interruption(std::atomic<bool>& flag);
  ~Interruption();
  Interruption(const Interruption&) = delete;
  Interruption& operator=(const Interruption&) = delete;

  /// The signal that came; 0 when none did.
  [[nodiscard]] int signal() const { return signal_; }

 private:
  void wait();

  std::atomic<bool>& flag_;
  std::atomic<int> signal_{0};
  std::atomic<bool> isOver_{false};
  sigset_t awaited_{};  ///< As the next, of the time before the thread.
  sigset_t blockedBefore_{};
  std::thread thread_;
};

}  // namespace Orvane
