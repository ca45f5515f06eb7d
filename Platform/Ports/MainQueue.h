// SPDX-License-Identifier: MIT
#pragma once

#include <chrono>
#include <functional>
#include <optional>

#include <Varnel/Platform/Api.h>

namespace Varnel::Platform {

/// The queue of the main thread. All code that uses notifications or sounds runs here.
///
///     mainQueue.post([this] { reload(); });  // from any thread
///
/// A host with a toolkit lets the toolkit's main loop run the blocks. One without calls `run`, or
/// waits in a loop of its own until the descriptor is readable and then calls `drain`. Blocks must
/// not throw.
class VARNEL_API MainQueue {
 public:
  using Block = std::function<void()>;

  virtual ~MainQueue() = default;
  MainQueue& operator=(const MainQueue&) = delete;

  /// Runs `block` on the main thread, later: never within this call, and behind every block that
  /// was posted before. Any thread.
  virtual void post(Block block) = 0;

  /// Whether the caller is on the main thread. Any thread.
  [[nodiscard]] virtual bool isCurrent() const = 0;

  /// Runs what is posted, and waits for more, until a `stop`. Main thread only.
  virtual void run() = 0;

  /// Ends the innermost `run` after the blocks posted before this call; if none is under way, the
  /// next `run`. Two stops end two runs. Any thread.
  virtual void stop() = 0;

  /// Runs what is posted, and waits for more, as long as the condition holds. The condition is
  /// checked at first and whenever something has run. Main thread only.
  virtual void runWhile(const std::function<bool()>& condition) = 0;
  /// The same for at most `patience`. False when the condition still holds then. What was posted
  /// before this call runs even without any patience (0 or less).
  virtual bool runWhile(const std::function<bool()>& condition,
                        std::chrono::milliseconds patience) = 0;

  /// Runs what is posted until nothing is left, without waiting. True if there was anything. Main
  /// thread only.
  virtual bool drain() = 0;

  /// A file descriptor to poll for reading. It is readable when `drain` has something to do, and
  /// sometimes when it has not. Call this again before each poll: the call registers what is to be
  /// waited for. The queue owns the descriptor. Absent where the system has none. Main thread only.
  [[nodiscard]] virtual std::optional<int> descriptor() = 0;
};

}  // namespace Varnel::Platform
