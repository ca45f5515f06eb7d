// SPDX-License-Identifier: MIT
#include <orvane/ManagedDiskTurns.h>

#include <algorithm>
#include <chrono>
#include <climits>
#include <system_error>

#include <Varnel/DiskAccess/DiskAccessGuard.h>
#include <Varnel/DiskAccess/DiskAccessManager.h>
#include <Varnel/Platform/Concurrency/StartThread.h>
#include <Varnel/Platform/Ports/VolumeCatalog.h>

namespace Orvane {
namespace {

using Varnel::OVDiskInfo;
using Varnel::Platform::URL;

/// The longest part of the path that the system accepts: the path itself or, if that is too long, a
/// folder above.
std::string askablePath(const std::string& path) {
  return path.size() < PATH_MAX ? path : path.substr(0, path.rfind('/', PATH_MAX - 1));
}

class TimedTurn final : public DiskTurn {
 public:
  bool isOver() override { return bytes_ >= maxBytes || Clock::now() >= end_; }
  void didRead(std::uint64_t bytes) override { bytes_ += bytes; }

 private:
  using Clock = std::chrono::steady_clock;
  static constexpr std::uint64_t maxBytes = 4 << 20;

  const Clock::time_point end_ = Clock::now() + std::chrono::milliseconds(20);
  std::uint64_t bytes_ = 0;
};

}  // namespace

/// A disk, and a place on it that stands for all.
struct ManagedDiskTurns::Disk : ScanDisk {
  URL url;
  std::optional<URL> volumeURL;
};

ManagedDiskTurns::ManagedDiskTurns(Ports ports, Varnel::Platform::QualityOfService qos,
                                   unsigned maxTasks)
    : ports_(ports), qos_(qos), maxTasks_(maxTasks) {}

ManagedDiskTurns::~ManagedDiskTurns() {
  {
    const std::lock_guard lock(mutex_);
    isEnding_ = true;
  }
  changed_.notify_all();
  for (std::thread& thread : threads_) thread.join();
}

const ScanDisk& ManagedDiskTurns::diskOf(const std::string& path) {
  std::string identifier;
  std::unique_ptr<Disk> found = lookUp(URL::fileURLWithPath(askablePath(path)), identifier);
  const std::lock_guard lock(mutex_);
  return *disks_.try_emplace(std::move(identifier), std::move(found)).first->second;
}

std::unique_ptr<ManagedDiskTurns::Disk> ManagedDiskTurns::lookUp(const URL& url,
                                                                 std::string& identifier) const {
  const auto volume = ports_.inventory.volumes.volumeURL(url);
  if (!volume || !*volume)
    return std::make_unique<Disk>(Disk{{.isReadable = false}, url, std::nullopt});
  identifier = (*volume)->absoluteString();
  auto disk = std::make_unique<Disk>(Disk{{}, url, **volume});
  for (const auto& info : OVDiskInfo::allDiskInfos(ports_.inventory)) {
    if (!info->volumeURLs() || !info->volumeURLs()->contains(**volume)) continue;
    identifier = info->uniqueID().value_or(identifier);
    disk->places = static_cast<unsigned>(
        std::clamp<std::int64_t>(info->maxTreads(), 1, std::max(maxTasks_, 1u)));
    disk->isOrdered = info->kind() != Varnel::OVDiskKindSolidState;
    break;
  }
  return disk;
}

void ManagedDiskTurns::start(const ScanDisk& disk, std::shared_ptr<DiskTask> task) {
  const std::lock_guard lock(mutex_);
  waiting_.emplace_back(static_cast<const Disk*>(&disk), std::move(task));
  if (idle_ >= waiting_.size()) return changed_.notify_one();
  try {
    threads_.push_back(Varnel::Platform::startThread("scan", [this] { work(); }));
  } catch (const std::system_error&) {
    // Out of threads: those that already run do the work.
    if (!threads_.empty()) return;
    waiting_.pop_back();
    throw;
  }
}

void ManagedDiskTurns::work() {
  std::unique_lock lock(mutex_);
  for (;;) {
    ++idle_;
    changed_.wait(lock, [&] { return isEnding_ || !waiting_.empty(); });
    --idle_;
    if (waiting_.empty()) return;
    const auto [disk, task] = std::move(waiting_.front());
    waiting_.pop_front();
    lock.unlock();
    run(*disk, *task);
    lock.lock();
  }
}

void ManagedDiskTurns::run(const Disk& disk, DiskTask& task) const {
  for (bool goesOn = true; goesOn;) {
    // No security scope to open: the user named the folders, and an unreadable file shows when it
    // is opened.
    const Varnel::DiskAccessGuard access(
        disk.volumeURL ? ports_.manager.beginAccessingURL(disk.url, "Search for duplicates", qos_,
                                                          false, std::nullopt, disk.volumeURL)
                       : nullptr);
    if (disk.isReadable && !access) return task.refuse();
    TimedTurn turn;
    goesOn = task.run(turn).has_value();
  }
}

}  // namespace Orvane
