// SPDX-License-Identifier: MIT
#pragma once

#include <chrono>
#include <cstdint>
#include <memory>
#include <thread>

#include <Varnel/Basalt/Block.h>

namespace Varnel {

/// A thread that runs blocks at once, in order, or at a time. Any thread. Blocks must not throw.
///
///     DiskReadingWatch watch("deadlines");
///     const auto timer = watch.at(deadline, [this] { giveUp(); });
///     …
///     watch.cancel(timer);
class DiskReadingWatch final {
 public:
  using Time = std::chrono::steady_clock::time_point;
  struct Timer {
    Time time{};
    std::uint64_t number = 0;  ///< None at 0.
    auto operator<=>(const Timer&) const = default;
  };

  /// Throws `std::system_error` when the system grants no thread.
  explicit DiskReadingWatch(const char* threadName);
  ~DiskReadingWatch() { close(); }
  DiskReadingWatch(const DiskReadingWatch&) = delete;
  DiskReadingWatch& operator=(const DiskReadingWatch&) = delete;

  /// On the calling thread once the watch is closed.
  void soon(Basalt::Block block);

  [[nodiscard]] Timer at(Time time, Basalt::Block block);
  /// The block may be running, or have run, by now.
  void cancel(Timer timer);

  /// Drops the timers, and waits until what was to run soon has run. Called from a block, it leaves
  /// what waits behind that block to the thread and returns.
  void close();

 private:
  struct State;

  const std::shared_ptr<State> state_;  ///< The thread's too.
  std::thread thread_;
};

}  // namespace Varnel
