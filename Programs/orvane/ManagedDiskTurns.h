// SPDX-License-Identifier: MIT
#pragma once

#include <condition_variable>
#include <deque>
#include <map>
#include <memory>
#include <mutex>
#include <string>
#include <thread>
#include <utility>
#include <vector>

#include <Scan/DiskTurns.h>
#include <Varnel/DiskAccess/OVDiskInfo.h>
#include <Varnel/Platform/Values/QualityOfService.h>
#include <Varnel/Platform/Values/URL.h>

namespace Varnel {
class DiskAccessManager;
}

namespace Orvane {

/// Gives turns as the process's disk access manager admits: each is a session, and ends after 4 MB
/// or 20 ms.
class ManagedDiskTurns final : public DiskTurns {
 public:
  struct Ports {
    Varnel::DiskAccessManager& manager;
    Varnel::OVDiskInfo::Ports inventory;
  };

  /// `maxTasks`: how many read at once on a disk, however many it admits.
  ManagedDiskTurns(Ports ports, Varnel::Platform::QualityOfService qos, unsigned maxTasks);
  /// Waits for the tasks.
  ~ManagedDiskTurns() override;

  const ScanDisk& diskOf(const std::string& path) override;
  void start(const ScanDisk& disk, std::shared_ptr<DiskTask> task) override;

 private:
  struct Disk;

  [[nodiscard]] std::unique_ptr<Disk> lookUp(const Varnel::Platform::URL& url,
                                             std::string& identifier) const;
  void work();
  void run(const Disk& disk, DiskTask& task) const;

  const Ports ports_;
  const Varnel::Platform::QualityOfService qos_;
  const unsigned maxTasks_;

  /// Guards what follows. Never held while a volume is looked up, as a file on a dead network share
  /// can keep its reader for ever.
  std::mutex mutex_;
  std::condition_variable changed_;
  std::map<std::string, std::unique_ptr<Disk>> disks_;  ///< By identifier.
  std::deque<std::pair<const Disk*, std::shared_ptr<DiskTask>>> waiting_;
  std::vector<std::thread> threads_;
  std::size_t idle_ = 0;
  bool isEnding_ = false;
};

}  // namespace Orvane
