// SPDX-License-Identifier: MIT
#pragma once

#include <array>
#include <atomic>
#include <cstddef>
#include <cstdint>
#include <memory>
#include <vector>

#include <Varnel/Basalt/Bag.h>
#include <Varnel/Basalt/Semaphore.h>
#include <Varnel/Basalt/ThreadID.h>
#include <Varnel/Platform/Api.h>
#include <Varnel/Platform/Values/QualityOfService.h>

namespace Basalt {
class SerialQueue;
}

namespace Varnel {

class OVDiskInfo;

/// The class of urgency in which a quality of service waits: 0 comes first.
[[nodiscard]] int urgencyClassOf(Platform::QualityOfService qos);
inline constexpr int urgencyClassCount = 4;

/// The record of one disk: the threads that access it and those that wait. `DiskAccessManager`
/// keeps one for each disk.
///
/// Held by `std::shared_ptr`. Its queue owns its state: unless said otherwise, operations run on
/// the queue.
class VARNEL_API DiskData final : public std::enable_shared_from_this<DiskData> {
 public:
  /// A thread's place in the line of a full disk. The thread waits for `sema`; the first to claim
  /// the request settles its outcome: the granting thread, or the waiting one when its time is up.
  class AccessRequest final {
   public:
    explicit AccessRequest(int urgencyClass) : urgencyClass_(urgencyClass) {}

    /// 0 for the class that is granted first.
    [[nodiscard]] int urgencyClass() const { return urgencyClass_; }

    /// True for the first caller alone. Any thread, as for the one below.
    [[nodiscard]] bool claim() { return !flag_.test_and_set(std::memory_order_acq_rel); }

    [[nodiscard]] bool isClaimed() const { return flag_.test(std::memory_order_relaxed); }

    Basalt::Semaphore sema;

   private:
    const int urgencyClass_;
    std::atomic_flag flag_;
  };

  DiskData(std::shared_ptr<const OVDiskInfo> diskInfo, bool isBackgroundMode,
           std::shared_ptr<Basalt::SerialQueue> queue);
  DiskData(const DiskData&) = delete;
  DiskData& operator=(const DiskData&) = delete;

  /// Any thread, as for the one below.
  [[nodiscard]] const std::shared_ptr<const OVDiskInfo>& diskInfo() const { return diskInfo_; }
  [[nodiscard]] Basalt::SerialQueue& queue() const { return *queue_; }

  [[nodiscard]] bool isBackgroundMode() const { return isBackgroundMode_; }
  void setIsBackgroundMode(bool isBackgroundMode) { isBackgroundMode_ = isBackgroundMode; }

  /// Admits the thread and returns null if there is a place free or the thread has one already;
  /// otherwise returns the request that the thread has to wait for, off the queue.
  [[nodiscard]] std::shared_ptr<AccessRequest> requestAccess(Basalt::ThreadID thread,
                                                             Platform::QualityOfService qos);

  /// Counts a thread whose request was granted.
  void confirmAccess(Basalt::ThreadID thread) { accessingThreads_.insert(thread); }

  /// Takes one place back and lets a grant pass follow.
  void releaseAccess(Basalt::ThreadID thread);

  /// If a place is free, grants all waiting requests, the most urgent class first and each class in
  /// order. A woken thread counts only once it has confirmed, so one free place wakes them all: it
  /// costs less to admit a few too many than to let a place stand empty while threads wake up.
  void grantPendingRequests();

  using Requests = std::vector<std::shared_ptr<AccessRequest>>;

  /// Empties the line: the requests that a pass grants, in the order in which it wakes their
  /// threads. Those whose thread has given up are dropped.
  [[nodiscard]] Requests claimPendingRequests();

  /// How many places are taken, a thread counting once for each that it has.
  [[nodiscard]] std::size_t accessCount() const { return accessingThreads_.count(); }

  /// How many threads wait in each class.
  [[nodiscard]] std::array<std::size_t, urgencyClassCount> waiterCounts() const;

  /// How many places there are now.
  [[nodiscard]] std::int64_t maxThreads() const { return isBackgroundMode_ ? 1 : maxThreads_; }

  /// How many requests stand in line, perhaps including some whose thread has given up.
  [[nodiscard]] std::size_t requestCount() const { return requests_.size(); }

 private:
  [[nodiscard]] bool hasFreePlace() const {
    return static_cast<std::int64_t>(accessingThreads_.count()) < maxThreads();
  }

  const std::shared_ptr<Basalt::SerialQueue> queue_;
  const std::shared_ptr<const OVDiskInfo> diskInfo_;
  const std::int64_t maxThreads_;  ///< Outside background mode.
  bool isBackgroundMode_;
  Requests requests_;  ///< In the order of coming.
  Basalt::Bag<Basalt::ThreadID> accessingThreads_;
};

}  // namespace Varnel
