// SPDX-License-Identifier: MIT
#pragma once

#include <map>
#include <memory>
#include <mutex>
#include <set>

#include <Varnel/Platform/Ports/SecurityScope.h>
#include <Varnel/Platform/Testing/FaultPlan.h>
#include <Varnel/Platform/Values/SystemText.h>

namespace Varnel::Platform::Testing {

/// A gate that opens for everything but what the test forbids, and counts. Any thread.
///
///     FakeSecurityScope scope;
///     scope.forbid(secret);
///     …
///     EXPECT_EQ(scope.openAccesses(file), 0);  // what was started was stopped
class FakeSecurityScope final : public SecurityScope {
 public:
  /// The calls of `startAccessing`, which a fault forbids.
  std::shared_ptr<FaultPlan> faults = std::make_shared<FaultPlan>();

  void forbid(const URL& url) {
    const std::lock_guard lock(mutex_);
    forbidden_.insert(url);
  }

  /// Starts less stops; negative when the gate was closed too often.
  [[nodiscard]] int openAccesses(const URL& url) const {
    const std::lock_guard lock(mutex_);
    const auto found = open_.find(url);
    return found == open_.end() ? 0 : found->second;
  }

  /// How often anything was asked for, granted or not.
  [[nodiscard]] int startCount() const {
    const std::lock_guard lock(mutex_);
    return starts_;
  }

  bool startAccessing(const URL& url) override {
    const bool isForbidden = faults->strikes() || !url.hasScheme("file") || isCutShort(url.path());
    const std::lock_guard lock(mutex_);
    ++starts_;
    if (isForbidden || forbidden_.contains(url)) return false;
    ++open_[url];
    return true;
  }

  void stopAccessing(const URL& url) override {
    const std::lock_guard lock(mutex_);
    --open_[url];
  }

 private:
  mutable std::mutex mutex_;  ///< Owns what follows.
  std::set<URL> forbidden_;
  std::map<URL, int> open_;
  int starts_ = 0;
};

}  // namespace Varnel::Platform::Testing
