// SPDX-License-Identifier: MIT
#include <orvane/ManagedDiskTurns.h>

#include <algorithm>
#include <climits>
#include <system_error>
#include <utility>

#include <Varnel/DiskAccess/DiskAccessManager.h>
#include <Varnel/DiskAccess/DiskReadingQueue.h>
#include <Varnel/DiskAccess/OVDiskInfo.h>
#include <Varnel/Platform/Concurrency/StartThread.h>
#include <Varnel/Platform/Ports/Ports.h>
#include <Varnel/Platform/Ports/VolumeCatalog.h>

namespace Orvane {
namespace {

using Varnel::DiskReadingFile;
using Varnel::DiskReadingNext;
using Varnel::DiskReadingResult;
using Varnel::DiskReadingTurn;
using Varnel::Platform::URL;

/// The longest part of the path that the system accepts: the path itself or, if that is too long, a
/// folder above.
std::string askablePath(const std::string& path) {
  return path.size() < PATH_MAX ? path : path.substr(0, path.rfind('/', PATH_MAX - 1));
}

/// The folder that a volume is mounted on.
std::string folderAt(const URL& volume) {
  std::string path = volume.path();
  if (path.size() > 1 && path.ends_with('/')) path.pop_back();
  return path;
}

bool isAmong(const std::vector<DiskReadingFile>& files, const DiskReadingFile& sought) {
  return std::any_of(files.begin(), files.end(),
                     [&](const auto& file) { return file.volumeURL == sought.volumeURL; });
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

}  // namespace

/// A disk, and a file on each of its volumes that were seen. A task is submitted for one of them,
/// and goes on under another when that volume is unmounted.
struct ManagedDiskTurns::Disk : ScanDisk {
  /// Of different volumes; one at least, or none ever. Guarded by the lock of the turns.
  mutable std::vector<DiskReadingFile> files;
};

class ManagedDiskTurns::QueueTask final : public Varnel::DiskReadingTask {
 public:
  QueueTask(ManagedDiskTurns& turns, const Disk& disk, std::shared_ptr<DiskTask> task,
            DiskReadingFile file)
      : turns_(turns), disk_(disk), task_(std::move(task)), file_(std::move(file)) {}

  DiskReadingNext run(DiskReadingTurn& turn) override {
    QueueTurn scanTurn(turn);
    const auto place = task_->run(scanTurn);
    return place ? DiskReadingNext::again(place) : DiskReadingNext::done();
  }

  void didEnd(DiskReadingResult result) override {
    if (result == DiskReadingResult::vanished)
      turns_.goOnWithout(file_, disk_, task_);
    else if (result != DiskReadingResult::read)
      task_->refuse();
  }

 private:
  ManagedDiskTurns& turns_;
  const Disk& disk_;
  const std::shared_ptr<DiskTask> task_;
  const DiskReadingFile file_;
};

Varnel::DiskReadingQueue& ManagedDiskTurns::sharedQueue() {
  const Varnel::Platform::Ports& ports = Varnel::Platform::processPorts();
  static auto& queue = *new Varnel::DiskReadingQueue(
      Varnel::DiskAccessManager::shared(),
      {.readingPriority = ports.readingPriority, .sharedPlaces = &ports.sessionBoard.get()});
  return queue;
}

ManagedDiskTurns::ManagedDiskTurns(Ports ports, Varnel::Platform::QualityOfService qos,
                                   unsigned maxTasks)
    : ports_(ports), qos_(qos), maxTasks_(std::max(maxTasks, 1u)) {}

ManagedDiskTurns::~ManagedDiskTurns() {
  for (std::thread& thread : threads_) thread.join();
}

std::vector<ScanMount> ManagedDiskTurns::mounts() {
  std::vector<ScanMount> mounts;
  for (const auto& volume : ports_.volumes.mountedVolumes()) {
    const bool isLocal = volume.isLocal.value_or(true);
    mounts.push_back(
        {folderAt(volume.url), isLocal ? ScanMount::Kind::local : ScanMount::Kind::network});
  }
  for (const URL& url : ports_.volumes.pseudoFileSystems())
    mounts.push_back({folderAt(url), ScanMount::Kind::pseudo});
  return mounts;
}

// What is mounted on the path itself is found without a look-up, for which it might keep us.
std::optional<URL> ManagedDiskTurns::volumeOf(const std::string& path) const {
  for (const auto& volume : ports_.volumes.mountedVolumes())
    if (folderAt(volume.url) == path) return volume.url;
  const auto found = ports_.volumes.volumeURL(URL::fileURLWithPath(askablePath(path)));
  return found ? *found : std::nullopt;
}

const ScanDisk& ManagedDiskTurns::diskOf(const std::string& path) {
  std::string identifier;
  const URL url = URL::fileURLWithPath(askablePath(path));
  auto disk = std::make_unique<Disk>();
  if (const auto volume = volumeOf(path)) {
    // No security scope to open: the user named the folders, and an unreadable file shows when it
    // is opened.
    disk->files.push_back({.url = url, .volumeURL = *volume, .enableSecureScopedAccess = false});
    identifier = volume->absoluteString();
    if (const auto info = ports_.queue.diskOfVolume(*volume)) {
      identifier = info->uniqueID().value_or(identifier);
      disk->places =
          static_cast<unsigned>(std::clamp<std::int64_t>(info->maxTreads(), 1, maxTasks_));
      disk->isOrdered = info->kind() != Varnel::OVDiskKindSolidState;
    }
  } else {
    disk->isReadable = false;
  }
  const std::lock_guard lock(mutex_);
  const auto [known, isNew] = disks_.try_emplace(std::move(identifier), std::move(disk));
  if (!isNew) {
    std::vector<DiskReadingFile>& files = known->second->files;
    for (DiskReadingFile& file : disk->files)
      if (!isAmong(files, file)) files.push_back(std::move(file));
  }
  return *known->second;
}

void ManagedDiskTurns::start(const ScanDisk& disk, std::shared_ptr<DiskTask> task) {
  std::unique_lock lock(mutex_);
  if (disk.isReadable) {
    const Disk& known = static_cast<const Disk&>(disk);
    const DiskReadingFile file = known.files.front();
    lock.unlock();
    return submit(known, std::move(task), file);
  }
  threads_.push_back(Varnel::Platform::startThread("scan", [task = std::move(task)] {
    EndlessTurn turn;
    while (task->run(turn)) {
    }
  }));
}

void ManagedDiskTurns::submit(const Disk& disk, std::shared_ptr<DiskTask> task,
                              const DiskReadingFile& file) {
  ports_.queue.submit(std::make_shared<QueueTask>(*this, disk, std::move(task), file), file,
                      {.propose = "Search for duplicates", .qos = qos_});
}

// What the task reads may lie on any volume of the disk. What lay on the one that is gone shows
// when it is opened.
void ManagedDiskTurns::goOnWithout(const DiskReadingFile& vanished, const Disk& disk,
                                   const std::shared_ptr<DiskTask>& task) {
  std::unique_lock lock(mutex_);
  std::vector<DiskReadingFile>& files = disk.files;
  if (files.size() > 1)
    std::erase_if(files, [&](const auto& file) { return file.volumeURL == vanished.volumeURL; });
  const DiskReadingFile next = files.front();
  lock.unlock();
  if (next.volumeURL == vanished.volumeURL) return task->refuse();
  try {
    submit(disk, task, next);
  } catch (const std::system_error&) {
    task->refuse();
  }
}

}  // namespace Orvane
