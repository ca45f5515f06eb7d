// SPDX-License-Identifier: MIT
#pragma once

#include <condition_variable>
#include <cstddef>
#include <limits>
#include <memory>
#include <mutex>
#include <stop_token>
#include <utility>

namespace Varnel::Platform::Testing {

/// What becomes of a call of a fake.
enum class Fault {
  none,
  fails,   ///< It fails as the port's calls do, and has done nothing.
  absent,  ///< It finds nobody there: no file, no server, no device.
  delays,  ///< It waits, and then works.
};

/// Which calls of a fake go wrong, from a certain one on.
///
///     FakeHTTPClient http;
///     http.faults->plan(Fault::fails, 3);     // the third call ever, and all after it
///     http.faults->plan(Fault::fails, 3, 1);  // the third alone
///     launcher.faults = http.faults;          // counts the calls of both in one row
///
/// A service is swept by making each of its calls fail in turn: see `sweepFaults`. Any thread; a
/// fake is given its plan before it is used.
class FaultPlan final {
 public:
  static constexpr std::size_t all = std::numeric_limits<std::size_t>::max();

  /// From the call of this number on (the first one ever is 1), so many calls meet the fault. An
  /// earlier plan is forgotten, and what it delays goes on.
  void plan(Fault fault, std::size_t first, std::size_t count = all) {
    const std::lock_guard lock(mutex_);
    fault_ = fault;
    first_ = first;
    count_ = count;
    changed_.notify_all();
  }

  /// Nothing goes wrong any more; delayed calls go on.
  void mend() { plan(Fault::none, 1); }

  /// How many calls there were.
  [[nodiscard]] std::size_t calls() const {
    const std::lock_guard lock(mutex_);
    return calls_;
  }

  /// Returns when there were so many calls, those that wait included.
  void waitForCalls(std::size_t count) const {
    std::unique_lock lock(mutex_);
    changed_.wait(lock, [&] { return calls_ >= count; });
  }

  /// For fakes. Counts a call and tells what becomes of it; never waits.
  [[nodiscard]] Fault next() {
    const std::lock_guard lock(mutex_);
    ++calls_;
    changed_.notify_all();
    return isStruck(calls_) ? fault_ : Fault::none;
  }

  /// For fakes whose callers wait. The same, but a delayed call waits until another plan is made or
  /// a stop is requested, and then works.
  [[nodiscard]] Fault nextInTime(std::stop_token stop = {}) {
    const Fault fault = next();
    if (fault != Fault::delays) return fault;
    std::unique_lock lock(mutex_);
    changed_.wait(lock, std::move(stop), [this] { return fault_ != Fault::delays; });
    return Fault::none;
  }

  /// For fakes that fail in one way. Whether the call goes wrong, in time.
  [[nodiscard]] bool strikes() { return nextInTime() != Fault::none; }

 private:
  [[nodiscard]] bool isStruck(std::size_t call) const {
    return call >= first_ && call - first_ < count_;
  }

  mutable std::mutex mutex_;  ///< Owns all below.
  mutable std::condition_variable_any changed_;
  Fault fault_ = Fault::none;
  std::size_t first_ = 1;
  std::size_t count_ = 0;
  std::size_t calls_ = 0;
};

/// Plays a scene again and again: call 1 goes wrong, in the next round call 2, until a round ends
/// before its call. The scene gets a new plan for its new fakes, and checks what it has promised.
///
///     sweepFaults(Fault::fails, [](const std::shared_ptr<FaultPlan>& faults) {
///       FakeHTTPClient http;
///       http.faults = faults;
///       …
///     });
///
/// `count` calls go wrong in each round. Returns how many calls were made to go wrong.
template <typename Scene>
std::size_t sweepFaults(Fault fault, Scene scene, std::size_t count = 1) {
  for (std::size_t call = 1;; ++call) {
    const auto faults = std::make_shared<FaultPlan>();
    faults->plan(fault, call, count);
    scene(faults);
    if (faults->calls() < call) return call - 1;
  }
}

}  // namespace Varnel::Platform::Testing
