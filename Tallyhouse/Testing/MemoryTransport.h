// SPDX-License-Identifier: MIT
#pragma once

#include <mutex>
#include <utility>
#include <vector>

#include <Varnel/Tallyhouse/AnalyticsTransport.h>

namespace Tallyhouse::Testing {

/// A transport that keeps its events for the test to look at. Any thread.
///
///     auto sent = std::make_shared<MemoryTransport>();
///     service(std::make_shared<AnalyticsTracker>(sent, Consent::granted)).run();
///     EXPECT_EQ(sent->events().at(0).action, "Notification Clicked");
class MemoryTransport final : public AnalyticsTransport {
 public:
  void start() noexcept override {}
  void accept(const AnalyticsEvent& event) noexcept override {
    const std::lock_guard lock(mutex_);
    events_.push_back(event);
  }
  void discardAll() noexcept override {
    const std::lock_guard lock(mutex_);
    events_.clear();
  }

  /// The events so far, oldest first.
  [[nodiscard]] std::vector<AnalyticsEvent> events() const {
    const std::lock_guard lock(mutex_);
    return events_;
  }

 private:
  mutable std::mutex mutex_;  ///< Owns `events_`.
  std::vector<AnalyticsEvent> events_;
};

}  // namespace Tallyhouse::Testing
