// SPDX-License-Identifier: MIT
#pragma once

#include <array>
#include <atomic>
#include <condition_variable>
#include <cstdint>
#include <map>
#include <memory>
#include <mutex>
#include <optional>
#include <stop_token>
#include <unordered_map>
#include <unordered_set>
#include <vector>

#include <Varnel/Basalt/NotificationCenter.h>
#include <Varnel/Basalt/ThreadID.h>
#include <Varnel/DiskAccess/DiskAccessState.h>
#include <Varnel/DiskAccess/DiskReadingLine.h>
#include <Varnel/DiskAccess/DiskReadingQueue.h>
#include <Varnel/DiskAccess/DiskReadingRequest.h>
#include <Varnel/DiskAccess/DiskReadingWatch.h>
#include <Varnel/DiskAccess/DiskReadingWorkers.h>
#include <Varnel/Platform/Ports/ReadingPriority.h>
#include <Varnel/Platform/Ports/SessionBoard.h>

namespace Varnel {

/// The requests for one disk, and the workers that serve them. A worker *applies* while it waits
/// for admission to the disk, for no request in particular, and *runs* while it has a place. It
/// chooses a request when it has been admitted.
struct DiskReadingLane {
  explicit DiskReadingLane(std::shared_ptr<DiskData> theRecord);

  [[nodiscard]] std::int64_t applicants() const;
  [[nodiscard]] std::int64_t workers() const { return starting + applicants() + running; }

  const std::shared_ptr<DiskData> record;
  DiskReadingLine line;
  std::int64_t starting = 0;
  std::array<std::int64_t, urgencyClassCount> applying{};
  std::int64_t running = 0;
};

/// The queue itself, shared by its workers. They may outlive its public face: one that waits for a
/// disk does so until the disk admits it. Any thread calls the operations.
class DiskReadingCore final : public std::enable_shared_from_this<DiskReadingCore> {
 public:
  using Ports = DiskReadingQueue::Ports;

  DiskReadingCore(std::shared_ptr<DiskAccessState> disks, Ports ports);

  /// Once, before anything else.
  void observeUnmounts();

  /// See `DiskReadingQueue::submit`. A request for a volume that was looked up at such a count of
  /// unmounts ends as `vanished` when the volume has been unmounted since.
  void submit(std::shared_ptr<DiskReadingTask> task, DiskReadingFile file,
              DiskReadingOptions options, std::optional<std::uint64_t> unmountCount = {});
  [[nodiscard]] std::uint64_t unmountCount();

  /// Runs a block that asks the file system, and may get stuck in it, or one that waits for the
  /// manager at most. `close` waits for a block that runs and drops one that does not. Both throw
  /// `std::system_error`, having done nothing, when there is no thread.
  void lookUp(Basalt::Block block);
  void plan(Basalt::Block block) { add(*plans_, std::move(block)); }

  /// Calls back, later: on the executor or, without one that can, one after another on a thread
  /// that does nothing else, so that a slow one keeps no time-out waiting.
  void callBack(const std::shared_ptr<Basalt::Executor>& executor, Basalt::Block block);

  /// See `~DiskReadingQueue`.
  void close();

  [[nodiscard]] DiskAccessState& disks() const { return *disks_; }
  [[nodiscard]] DiskReadingWatch& watch() { return watch_; }
  [[nodiscard]] std::stop_token closing() const { return closing_.get_token(); }

 private:
  using Lock = std::unique_lock<std::mutex>;
  using Request = std::shared_ptr<DiskReadingRequest>;
  struct Application;
  struct Stay;
  /// Where the disk is shared by processes, its place among them belongs to the session.
  struct Admission {
    std::unique_ptr<DiskAccessingSession> session{};
    std::unique_ptr<Platform::SessionBoard::Place> place{};
  };
  class PriorityOfThread;

  /// Beyond these, readers of one disk only cost threads, whatever a kind of the host's own admits.
  static constexpr std::int64_t maxWorkers = 64;

  void add(DiskReadingJobs& jobs, Basalt::Block block);

  // From submission to the line of a disk. What follows runs under the lock where it gets none.
  [[nodiscard]] bool isUnmountedSince(const Platform::URL& volumeURL, std::uint64_t count);
  void lookUpVolume(const Request& request);
  void place(const Request& request);
  void enqueue(const Request& request, std::shared_ptr<DiskData> record);

  // Ending a request.
  void stop(const Request& request, DiskReadingResult result);
  void end(const Request& request, DiskReadingResult result);
  void settle(const Request& request);
  void endRequestsOf(const Platform::URL& volumeURL);

  // Workers. A lane stays while it counts one.
  [[nodiscard]] std::int64_t maxRunning(const DiskReadingLane& lane) const;
  [[nodiscard]] std::optional<int> classToApplyFor(const DiskReadingLane& lane) const;
  void callWorkers(DiskReadingLane& lane);
  void callWorkersLater(const DiskReadingLane& lane);
  void serve(DiskReadingLane& lane);
  void forgetInheritedPriority();
  [[nodiscard]] std::optional<Application> apply(DiskReadingLane& lane);
  [[nodiscard]] std::optional<std::string> sharedNameOf(const DiskData& record) const;
  [[nodiscard]] Admission admit(const std::shared_ptr<DiskData>& record,
                                const std::optional<std::string>& sharedName,
                                const DiskAccessState::Access& access) const;
  void endImpatientRequests(const DiskReadingLane& lane);
  void removeIfUnused(const DiskReadingLane& lane);

  // Turns.
  void takeTurn(Lock& lock, Stay& stay);
  [[nodiscard]] Request runRequests(Lock& lock, Stay& stay);
  [[nodiscard]] Request nextRequest(Lock& lock, Stay& stay, bool isFirst);
  void begin(DiskReadingRequest& request, std::atomic<bool>& isTurnEnded);
  void run(Lock& lock, const Request& request, DiskReadingTurn& turn, PriorityOfThread& priority);
  void leaveBusy(Basalt::ThreadID thread);
  void offer(Lock& lock, const Request& request, Stay& stay);
  void enqueueAfterPause(const Request& request);
  void runOffered(const Request& request, Stay& stay);

  const std::shared_ptr<DiskAccessState> disks_;
  const Ports ports_;
  const std::optional<Platform::ReadingPriority::Level> normalPriority_;
  const std::shared_ptr<DiskReadingWorkers> workers_ = std::make_shared<DiskReadingWorkers>();
  /// A dead share keeps who asks it for ever, and nobody else.
  const std::shared_ptr<DiskReadingJobs> lookups_ = std::make_shared<DiskReadingJobs>(workers_, 16);
  const std::shared_ptr<DiskReadingJobs> plans_ = std::make_shared<DiskReadingJobs>(workers_, 1);
  std::optional<Basalt::NotificationCenter::Observer> unmounts_;
  std::stop_source closing_;

  std::mutex mutex_;                      ///< Owns what follows, and the requests.
  std::unordered_set<Request> requests_;  ///< All that have not ended.
  std::map<const DiskData*, DiskReadingLane> lanes_;
  std::uint64_t lastNumber_ = 0;
  std::uint64_t unmountCount_ = 0;
  std::unordered_map<Platform::URL, std::uint64_t> lastUnmounts_;  ///< Their counts.
  std::vector<Basalt::ThreadID> busy_;  ///< In a callback, a look-up or a plan.
  std::condition_variable busyChanged_;
  std::condition_variable offerChanged_;
  bool isClosed_ = false;

  DiskReadingWatch watch_{"disk-reading-watch"};
  DiskReadingWatch results_{"disk-results"};
};

}  // namespace Varnel
