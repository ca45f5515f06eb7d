// SPDX-License-Identifier: MIT
#pragma once

#include <condition_variable>
#include <mutex>
#include <string>
#include <thread>

#include <Varnel/DiskWatch/DiskAccessWatch.h>
#include <Varnel/Platform/Api.h>

namespace Varnel {

/// Has a watch look at a manager's disks twice a second, on a thread of its own, for as long as it
/// lives: while a program reads much, say.
///
///     const DiskAccessWatcher watcher("orvane");
///     scan();
///
/// A look costs a call on the manager's queue and, when there is something new to show, a small
/// file. Where the system grants no thread nobody looks.
class VARNEL_API DiskAccessWatcher final {
 public:
  /// One of `DiskAccessManager::shared()`, with the process's board and logger.
  explicit DiskAccessWatcher(std::string program);
  DiskAccessWatcher(DiskAccessWatch::Ports ports, std::string program);
  /// Waits for a look that is under way.
  ~DiskAccessWatcher();
  DiskAccessWatcher(const DiskAccessWatcher&) = delete;
  DiskAccessWatcher& operator=(const DiskAccessWatcher&) = delete;

 private:
  void run();

  DiskAccessWatch watch_;  ///< The thread's.
  std::mutex mutex_;       ///< Owns the next.
  bool isOver_ = false;
  std::condition_variable changed_;
  std::thread thread_;
};

}  // namespace Varnel
