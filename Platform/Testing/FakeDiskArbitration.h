// SPDX-License-Identifier: MIT
#pragma once

#include <atomic>
#include <map>
#include <memory>
#include <mutex>
#include <string>
#include <utility>
#include <vector>

#include <Varnel/Platform/Ports/DiskArbitration.h>
#include <Varnel/Platform/Testing/FaultPlan.h>

namespace Varnel::Platform::Testing {

/// Disks mounted where the test says. Any thread.
///
///     FakeDiskArbitration disks;
///     disks.setMountURLs("sda1", {URL::fileURLWithPath("/home/")});
class FakeDiskArbitration final : public DiskArbitration {
 public:
  /// The opening of sessions, and their questions: wrong ones find nothing.
  std::shared_ptr<FaultPlan> faults = std::make_shared<FaultPlan>();

  /// Mounts the device at these places from now on. Open sessions keep the view that they began
  /// with.
  void setMountURLs(const std::string& deviceName, std::vector<URL> urls) {
    const std::lock_guard lock(mutex_);
    if (std::exchange(isHandedOut_, false)) mounts_ = std::make_shared<Mounts>(*mounts_);
    mounts_->insert_or_assign(deviceName, std::move(urls));
  }

  /// A service out of reach opens no session.
  void setReachable(bool reachable) {
    const std::lock_guard lock(mutex_);
    reachable_ = reachable;
  }

  /// How many sessions exist right now, and how many were ever opened.
  [[nodiscard]] int liveSessions() const { return counts_->live; }
  [[nodiscard]] int openedSessions() const { return counts_->opened; }

  std::unique_ptr<Session> openSession() override {
    if (faults->strikes()) return nullptr;
    const std::lock_guard lock(mutex_);
    if (!reachable_) return nullptr;
    isHandedOut_ = true;
    return std::make_unique<FakeSession>(mounts_, counts_, faults);
  }

 private:
  using Mounts = std::map<std::string, std::vector<URL>>;

  struct Counts {
    std::atomic<int> live = 0;
    std::atomic<int> opened = 0;
  };

  class FakeSession final : public Session {
   public:
    FakeSession(std::shared_ptr<const Mounts> mounts, std::shared_ptr<Counts> counts,
                std::shared_ptr<FaultPlan> faults)
        : mounts_(std::move(mounts)), counts_(std::move(counts)), faults_(std::move(faults)) {
      ++counts_->live;
      ++counts_->opened;
    }
    ~FakeSession() override { --counts_->live; }

    std::vector<URL> mountURLs(const std::string& deviceName) override {
      if (faults_->strikes()) return {};
      const auto found = mounts_->find(deviceName);
      return found == mounts_->end() ? std::vector<URL>() : found->second;
    }

   private:
    const std::shared_ptr<const Mounts> mounts_;
    const std::shared_ptr<Counts> counts_;
    const std::shared_ptr<FaultPlan> faults_;
  };

  const std::shared_ptr<Counts> counts_ = std::make_shared<Counts>();
  std::mutex mutex_;  ///< Owns what follows.
  std::shared_ptr<Mounts> mounts_ = std::make_shared<Mounts>();
  bool isHandedOut_ = false;  ///< Then `mounts_` is replaced, not changed.
  bool reachable_ = true;
};

}  // namespace Varnel::Platform::Testing
