// SPDX-License-Identifier: MIT
#pragma once

#include <array>
#include <atomic>
#include <cstddef>
#include <deque>
#include <memory>

#include <Basalt/Bag.h>
#include <Basalt/Semaphore.h>
#include <Basalt/ThreadID.h>
#include <Platform/Api.h>
#include <Platform/Values/QualityOfService.h>

namespace Basalt {
class SerialQueue;
}

namespace Varnel {

class OVDiskInfo;

/// The record of one disk: who accesses it and who waits to. `DiskAccessManager` keeps one a disk.
///
/// Held by `std::shared_ptr`. Its queue owns its state: unless said otherwise, operations run on
/// the queue.
class VARNEL_API DiskData final : public std::enable_shared_from_this<DiskData> {
 public:
  /// A thread's place in the line of a full disk. The thread waits for `sema`; whoever claims the
  /// request first settles its outcome: the granter, or the thread when its time is up.
  class AccessRequest final {
   public:
    /// True for the first caller alone. Any thread.
    [[nodiscard]] bool claim() { return !flag_.test_and_set(std::memory_order_acq_rel); }

    Basalt::Semaphore sema;

   private:
    std::atomic_flag flag_;
  };

  DiskData(std::shared_ptr<const OVDiskInfo> diskInfo, bool isBackgroundMode,
           std::shared_ptr<Basalt::SerialQueue> queue);
  DiskData(const DiskData&) = delete;
  DiskData& operator=(const DiskData&) = delete;

  /// Any thread, as the one below.
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

  /// Whether no thread accesses the disk and none waits to.
  [[nodiscard]] bool isIdle() const;

  /// How many places are taken.
  [[nodiscard]] std::size_t accessCount() const { return accessingThreads_.count(); }

 private:
  using Requests = std::deque<std::shared_ptr<AccessRequest>>;

  [[nodiscard]] bool hasFreePlace() const;
  [[nodiscard]] bool hasRequests() const;

  const std::shared_ptr<const OVDiskInfo> diskInfo_;
  const std::shared_ptr<Basalt::SerialQueue> queue_;
  bool isBackgroundMode_;
  Basalt::Bag<Basalt::ThreadID> accessingThreads_;
  std::array<Requests, 4> requests_;  ///< One line a class, the most urgent class first.
};

}  // namespace Varnel
