// SPDX-License-Identifier: MIT
#pragma once

#include <algorithm>
#include <functional>
#include <memory>
#include <optional>
#include <utility>

#include <Varnel/Platform/Ports/WallClockTimer.h>
#include <Varnel/Platform/Testing/FaultPlan.h>
#include <Varnel/Platform/Testing/SimulatedClock.h>

namespace Varnel::Platform::Testing {

/// A timer on a simulated clock. The test moves the clock through it.
///
///     timer.advanceTo(midnight);    // calls back at each date on the way, as if nobody slept
///     timer.setClock(later);        // sets the clock: calls back once, when it has jumped
///
/// One thread.
class FakeWallClockTimer final : public WallClockTimer {
 public:
  /// The calls of `arm`: one that goes wrong arms nothing, a delayed one rings only at the end of
  /// `advanceTo`.
  std::shared_ptr<FaultPlan> faults = std::make_shared<FaultPlan>();

  explicit FakeWallClockTimer(SimulatedClock& clock) : clock_(clock) {}

  void setHandler(std::function<void()> handler) override { handler_ = std::move(handler); }
  void arm(Date date) override {
    const Fault fault = faults->next();
    isLate_ = fault == Fault::delays;
    armed_ = fault == Fault::none || isLate_ ? std::optional(date) : std::nullopt;
  }
  void disarm() override { armed_.reset(); }

  /// The date that the timer waits for.
  [[nodiscard]] const std::optional<Date>& armedDate() const { return armed_; }

  void advanceTo(Date date) {
    while (armed_ && *armed_ <= date) {
      clock_.set(isLate_ ? date : std::max(clock_.now(), *armed_));
      fire();
    }
    clock_.set(date);
  }

  /// Acts as a user who sets the clock, or as a machine that wakes up.
  void setClock(Date date) {
    clock_.set(date);
    if (armed_) fire();
  }

 private:
  void fire() {
    armed_.reset();
    if (const auto handler = handler_) handler();
  }

  SimulatedClock& clock_;
  std::function<void()> handler_;
  std::optional<Date> armed_;
  bool isLate_ = false;
};

}  // namespace Varnel::Platform::Testing
