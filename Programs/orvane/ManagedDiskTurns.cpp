// SPDX-License-Identifier: MIT
#include <orvane/ManagedDiskTurns.h>

#include <algorithm>
#include <climits>
#include <optional>
#include <utility>

#include <Varnel/DiskAccess/DiskReadingQueue.h>
#include <Varnel/DiskAccess/OVDiskInfo.h>
#include <Varnel/Platform/Concurrency/StartThread.h>
#include <Varnel/Platform/Ports/VolumeCatalog.h>

namespace Orvane {
namespace {

using Varnel::DiskReadingNext;
using Varnel::DiskReadingResult;
using Varnel::DiskReadingTurn;
using Varnel::Platform::URL;

/// The longest part of the path that the system accepts: the path itself or, if that is too long, a
/// folder above.
std::string askablePath(const std::string& path) {
  return path.size() < PATH_MAX ? path : path.substr(0, path.rfind('/', PATH_MAX - 1));
}

class QueueTurn final : public DiskTurn {
 public:
  explicit QueueTurn(DiskReadingTurn& turn) : turn_(turn) {}
  bool isOver() override { return turn_.isOver(); }
  void didRead(std::uint64_t bytes) override { turn_.didRead(bytes); }

 private:
  DiskReadingTurn& turn_;
};

/// Where there is no disk, nobody waits for it.
class EndlessTurn final : public DiskTurn {
 public:
  bool isOver() override { return false; }
  void didRead(std::uint64_t) override {}
};

class QueueTask final : public Varnel::DiskReadingTask {
 public:
  explicit QueueTask(std::shared_ptr<DiskTask> task) : task_(std::move(task)) {}

  DiskReadingNext run(DiskReadingTurn& turn) override {
    QueueTurn scanTurn(turn);
    const auto place = task_->run(scanTurn);
    return place ? DiskReadingNext::again(place) : DiskReadingNext::done();
  }

  void didEnd(DiskReadingResult result) override {
    if (result != DiskReadingResult::read) task_->refuse();
  }

 private:
  const std::shared_ptr<DiskTask> task_;
};

}  // namespace

/// A disk, and a file and a volume on it that stand for all.
struct ManagedDiskTurns::Disk : ScanDisk {
  URL url;
  std::optional<URL> volumeURL;
};

ManagedDiskTurns::ManagedDiskTurns(Ports ports, Varnel::Platform::QualityOfService qos,
                                   unsigned maxTasks)
    : ports_(ports), qos_(qos), maxTasks_(std::max(maxTasks, 1u)) {}

ManagedDiskTurns::~ManagedDiskTurns() {
  for (std::thread& thread : threads_) thread.join();
}

const ScanDisk& ManagedDiskTurns::diskOf(const std::string& path) {
  std::string identifier;
  const URL url = URL::fileURLWithPath(askablePath(path));
  auto disk = std::make_unique<Disk>(Disk{{}, url, std::nullopt});
  const auto volume = ports_.volumes.volumeURL(url);
  if (volume && *volume) {
    disk->volumeURL = **volume;
    identifier = (*volume)->absoluteString();
    if (const auto info = ports_.queue.diskOfVolume(**volume)) {
      identifier = info->uniqueID().value_or(identifier);
      disk->places =
          static_cast<unsigned>(std::clamp<std::int64_t>(info->maxTreads(), 1, maxTasks_));
      disk->isOrdered = info->kind() != Varnel::OVDiskKindSolidState;
    }
  } else {
    disk->isReadable = false;
  }
  const std::lock_guard lock(mutex_);
  return *disks_.try_emplace(std::move(identifier), std::move(disk)).first->second;
}

void ManagedDiskTurns::start(const ScanDisk& disk, std::shared_ptr<DiskTask> task) {
  const Disk& known = static_cast<const Disk&>(disk);
  if (known.isReadable) {
    // No security scope to open: the user named the folders, and an unreadable file shows when it
    // is opened.
    return ports_.queue.submit(
        std::make_shared<QueueTask>(std::move(task)),
        {.url = known.url, .volumeURL = known.volumeURL, .enableSecureScopedAccess = false},
        {.propose = "Search for duplicates", .qos = qos_});
  }
  const std::lock_guard lock(mutex_);
  threads_.push_back(Varnel::Platform::startThread("scan", [task = std::move(task)] {
    EndlessTurn turn;
    while (task->run(turn)) {
    }
  }));
}

}  // namespace Orvane
