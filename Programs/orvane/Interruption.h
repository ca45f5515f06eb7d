// SPDX-License-Identifier: MIT
#pragma once

#include <atomic>

namespace Orvane {

/// While it lives, the first SIGINT, SIGTERM or SIGHUP sets a flag instead of ending the program; a
/// second one ends it, and leaves no line of progress on the terminal. One object at a time.
///
///     Interruption interruption(control.isCancelled);
///     …
///     if (interruption.signal() != 0) return 128 + interruption.signal();
class Interruption final {
 public:
  /// `flag` outlives the object.
  explicit Interruption(std::atomic<bool>& flag);
  ~Interruption();
  Interruption(const Interruption&) = delete;
  Interruption& operator=(const Interruption&) = delete;

  /// The signal that came; 0 when none did.
  [[nodiscard]] int signal() const;
};

}  // namespace Orvane
