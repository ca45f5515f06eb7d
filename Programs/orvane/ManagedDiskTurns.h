// SPDX-License-Identifier: MIT
#pragma once

#include <map>
#include <memory>
#include <mutex>
#include <optional>
#include <string>
#include <thread>
#include <vector>

#include <Scan/DiskTurns.h>
#include <Varnel/Platform/Values/QualityOfService.h>
#include <Varnel/Platform/Values/URL.h>

namespace Varnel {
class DiskReadingQueue;
struct DiskReadingFile;
}  // namespace Varnel
namespace Varnel::Platform {
class VolumeCatalog;
}

namespace Orvane {

/// Gives the turns of the process's reading queue.
class ManagedDiskTurns final : public DiskTurns {
 public:
  struct Ports {
    Varnel::DiskReadingQueue& queue;
    Varnel::Platform::VolumeCatalog& volumes;
  };

  /// The queue of the process that shares the places of its disks with other processes. Never
  /// destroyed; throws as `DiskReadingQueue` does.
  [[nodiscard]] static Varnel::DiskReadingQueue& sharedQueue();

  /// `maxTasks`: how many tasks share a disk, however many it admits.
  ManagedDiskTurns(Ports ports, Varnel::Platform::QualityOfService qos, unsigned maxTasks);
  /// Waits for tasks on no known volume. Those on disks must be done.
  ~ManagedDiskTurns() override;

  std::vector<ScanMount> mounts() override;
  const ScanDisk& diskOf(const std::string& path) override;
  void start(const ScanDisk& disk, std::shared_ptr<DiskTask> task) override;

 private:
  struct Disk;
  class QueueTask;

  [[nodiscard]] std::optional<Varnel::Platform::URL> volumeOf(const std::string& path) const;
  void submit(const Disk& disk, std::shared_ptr<DiskTask> task,
              const Varnel::DiskReadingFile& file);
  void goOnWithout(const Varnel::DiskReadingFile& vanished, const Disk& disk,
                   const std::shared_ptr<DiskTask>& task);

  const Ports ports_;
  const Varnel::Platform::QualityOfService qos_;
  const unsigned maxTasks_;

  /// Guards what follows. Never held while a volume is looked up, as a file on a dead network share
  /// can keep its reader for ever.
  std::mutex mutex_;
  std::map<std::string, std::unique_ptr<Disk>> disks_;  ///< By identifier.
  std::vector<std::thread> threads_;                    ///< Of tasks on no known volume.
};

}  // namespace Orvane
