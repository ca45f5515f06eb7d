// SPDX-License-Identifier: MIT
#pragma once

#include <functional>
#include <memory>
#include <vector>

#include <Varnel/DiskAccess/DiskReadingTask.h>
#include <Varnel/Platform/Api.h>
#include <Varnel/Platform/Values/URL.h>

namespace Varnel::Platform {
class ReadingPriority;
class SessionBoard;
struct Ports;
}  // namespace Varnel::Platform

namespace Varnel {

class DiskAccessManager;
class DiskReadingCore;
class OVDiskInfo;

/// Gives turns on the disks to readers of any number, and never to more at once on a disk than its
/// record admits (one in background mode). The more urgent class comes first; within a class, the
/// reader that is next on the way up the disk or, where a seek costs nothing, the one that came
/// first. Those that need many turns take them in rotation. Disks are read side by side.
///
///     DiskReadingQueue::shared().read(
///         {{.url = file}}, {.propose = "preview", .executor = mainQueue},
///         [this](const DiskReadingFile& file, DiskReadingTurn&) {
///           show(contentOf(file.url));
///           return DiskReadingNext::done();
///         },
///         [](const DiskReadingFile&, DiskReadingResult) {});
///
/// Each turn is one session of the `DiskAccessManager`. It covers as many small files or tasks as
/// fit, and part of a large one. So another session of the process waits for one turn at most.
///
/// Any thread, callbacks included. No call waits for a disk, and a stop or a time-out is answered
/// at once, whatever the disk does. A callback that waits for an executor holds no place: one that
/// the executor does not begin within a turn's time is put off. In a forked child, where its
/// threads are missing, a queue answers everything with `stopped`, within the call.
class VARNEL_API DiskReadingQueue final {
 public:
  /// Reads one file inside a place on its disk, at once or, like a task, in several calls.
  using Read = std::function<DiskReadingNext(const DiskReadingFile&, DiskReadingTurn&)>;
  /// Is told once for each file how its reading ended.
  using DidEnd = std::function<void(const DiskReadingFile&, DiskReadingResult)>;

  /// What a queue asks beside its manager. The priority outlives the queue, and a callback on an
  /// executor that destroys it.
  struct Ports {
    Platform::ReadingPriority& readingPriority;
    DiskReadingTurn::Now now = DiskReadingTurn::Clock::now;  ///< Measures turns.

    /// Where queues of several processes share the places of their disks: of all together, no more
    /// run at once on a disk than it admits. None: each process has the disk for itself. Disks that
    /// tell no identifier, and sessions that the queue does not begin, are not shared. A board
    /// outlives every thread that waits for it, and so is best never destroyed.
    Platform::SessionBoard* sharedPlaces = nullptr;
  };

  /// The manager outlives the queue. All throw `std::system_error` when the system grants no
  /// thread.
  explicit DiskReadingQueue(DiskAccessManager& manager);
  DiskReadingQueue(DiskAccessManager& manager, Ports ports);
  DiskReadingQueue(DiskAccessManager& manager, const Platform::Ports& ports);

  /// Stops everything, and waits for callbacks that are running on other threads and for look-ups
  /// of volumes. Afterwards nothing is called back but results that an executor still has to
  /// deliver and, when a callback destroys the queue, what follows that callback.
  ~DiskReadingQueue();
  DiskReadingQueue(const DiskReadingQueue&) = delete;
  DiskReadingQueue& operator=(const DiskReadingQueue&) = delete;

  /// The process's queue, over `DiskAccessManager::shared()`, made on first use and never
  /// destroyed.
  [[nodiscard]] static DiskReadingQueue& shared();

  /// Reads the files in the order that suits their disks, on as many threads as these admit.
  /// `didEnd` is called for a file right after it was read, still inside the place. The callbacks
  /// are called on several threads at once unless the executor or the disk prevents it, and must
  /// not throw. Throws `std::system_error`, having done nothing, when the system grants no thread.
  void read(std::vector<DiskReadingFile> files, DiskReadingOptions options, Read read,
            DidEnd didEnd);

  /// Gives a task turns on the disk of `file` until it is done. Throws as `read` does.
  void submit(std::shared_ptr<DiskReadingTask> task, DiskReadingFile file,
              DiskReadingOptions options);

  /// The disk of a volume, as turns on it are counted; null when the volume is on none that is
  /// known. Waits for an inventory that is under way. The disk's identifier stays the same while
  /// the volume stays mounted.
  [[nodiscard]] std::shared_ptr<const OVDiskInfo> diskOfVolume(
      const Platform::URL& volumeURL) const;

 private:
  const std::shared_ptr<DiskReadingCore> core_;
  const unsigned process_;  ///< Grows with each fork.
};

}  // namespace Varnel
