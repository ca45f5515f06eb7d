// SPDX-License-Identifier: MIT
#include <Varnel/DiskAccess/DiskReadingCore.h>

#include <algorithm>
#include <chrono>
#include <system_error>
#include <utility>

#include <Varnel/DiskAccess/VolumeChangeRelay.h>
#include <Varnel/DiskAccess/WaitingDeadline.h>
#include <Varnel/Platform/Ports/VolumeCatalog.h>

namespace Varnel {
namespace {

/// A look-up that takes longer is stuck.
constexpr std::chrono::seconds maxLookUpTime{1};

}  // namespace

DiskReadingCore::DiskReadingCore(std::shared_ptr<DiskAccessState> disks, Ports ports)
    : disks_(std::move(disks)),
      ports_(std::move(ports)),
      normalPriority_(ports_.readingPriority.ofMainThread()) {}

void DiskReadingCore::observeUnmounts() {
  unmounts_ = disks_->notificationCenter().addObserver(
      std::string(didUnmountNotification),
      [weak = weak_from_this()](const Basalt::Notification& change) {
        const auto self = weak.lock();
        const auto volume = volumeURLOf(change);
        if (self && volume) self->endRequestsOf(*volume);
      });
}

void DiskReadingCore::add(DiskReadingJobs& jobs, Basalt::Block block) {
  jobs.add([self = shared_from_this(), block = std::move(block)]() mutable {
    const Basalt::ThreadID thread = Basalt::currentThreadID();
    {
      const Lock lock(self->mutex_);
      if (self->isClosed_) return;
      self->busy_.push_back(thread);
    }
    block();
    block = {};
    const Lock lock(self->mutex_);
    self->leaveBusy(thread);
  });
}

void DiskReadingCore::lookUp(Basalt::Block block) {
  add(*lookups_, [self = shared_from_this(), block = std::move(block)]() mutable {
    // Set by the first of the two: the end of the look-up, and that of the time for it.
    const auto isSettled = std::make_shared<std::atomic<bool>>(false);
    const auto timer = self->watch_.at(DiskReadingWatch::Time::clock::now() + maxLookUpTime,
                                       [jobs = self->lookups_, isSettled] {
                                         if (!isSettled->exchange(true)) jobs->didGetStuck();
                                       });
    block();
    block = {};
    self->watch_.cancel(timer);
    if (isSettled->exchange(true)) self->lookups_->goesOn();
  });
}

void DiskReadingCore::callBack(const std::shared_ptr<Basalt::Executor>& executor,
                               Basalt::Block block) {
  if (!executor) return results_.soon(std::move(block));
  watch_.soon([self = shared_from_this(), executor,
               block = std::make_shared<Basalt::Block>(std::move(block))] {
    try {
      executor->execute([block] { (*block)(); });
    } catch (const std::system_error&) {
      self->results_.soon([block] { (*block)(); });
    }
  });
}

// From submission to the line of a disk.

void DiskReadingCore::submit(std::shared_ptr<DiskReadingTask> task, DiskReadingFile file,
                             DiskReadingOptions options,
                             std::optional<std::uint64_t> unmountCount) {
  Request request;
  bool isAccepted = false;
  {
    const Lock lock(mutex_);
    request = std::make_shared<DiskReadingRequest>(std::move(task), std::move(file),
                                                   std::move(options), ++lastNumber_);
    isAccepted = !isClosed_;
    if (isAccepted) requests_.insert(request);
  }
  if (!isAccepted)
    return callBack(request->options.executor,
                    [task = request->task] { task->didEnd(DiskReadingResult::stopped); });
  const auto stopper = [self = weak_from_this(),
                        weak = std::weak_ptr(request)](DiskReadingResult result) {
    return [self, weak, result] {
      const auto core = self.lock();
      const auto living = weak.lock();
      if (!core || !living) return;
      const Lock lock(core->mutex_);
      core->stop(living, result);
    };
  };
  request->stopCallback.emplace(request->options.stop, stopper(DiskReadingResult::stopped));
  if (unmountCount && isUnmountedSince(*request->file.volumeURL, *unmountCount))
    return stopper(DiskReadingResult::vanished)();
  try {
    if (request->file.volumeURL)
      plan([self = shared_from_this(), request] { self->place(request); });
    else
      lookUp([self = shared_from_this(), request] { self->lookUpVolume(request); });
  } catch (const std::system_error&) {
    const Lock lock(mutex_);
    if (request->state == DiskReadingRequest::State::ended) return;
    settle(request);
    throw;
  }
  const auto maxWaiting = maxWaitingTime(request->options.accessWaitingTimeout);
  const Lock lock(mutex_);
  if (!maxWaiting || request->isImpatient() || request->hasBegun ||
      request->state == DiskReadingRequest::State::ended)
    return;
  request->timer = watch_.at(DiskReadingWatch::Time::clock::now() + *maxWaiting,
                             stopper(DiskReadingResult::timedOut));
}

std::uint64_t DiskReadingCore::unmountCount() {
  const Lock lock(mutex_);
  return unmountCount_;
}

bool DiskReadingCore::isUnmountedSince(const Platform::URL& volumeURL, std::uint64_t count) {
  const Lock lock(mutex_);
  const auto last = lastUnmounts_.find(volumeURL);
  return last != lastUnmounts_.end() && last->second > count;
}

void DiskReadingCore::lookUpVolume(const Request& request) {
  const auto isEnded = [&] { return request->state == DiskReadingRequest::State::ended; };
  Lock lock(mutex_);
  while (!isEnded()) {
    const std::uint64_t unmountCount = unmountCount_;
    lock.unlock();
    const auto volume = disks_->volumes().volumeURL(request->file.url);
    lock.lock();
    if (isEnded()) return;
    if (!volume || !*volume) return end(request, DiskReadingResult::unknownVolume);
    // Another volume may hold the path since one was unmounted.
    if (unmountCount != unmountCount_) continue;
    request->volumeURL = *volume;
    lock.unlock();
    return place(request);
  }
}

void DiskReadingCore::place(const Request& request) {
  auto record = disks_->settledRecordOfVolume(*request->volumeURL);
  const Lock lock(mutex_);
  if (request->state == DiskReadingRequest::State::placing) enqueue(request, std::move(record));
}

void DiskReadingCore::enqueue(const Request& request, std::shared_ptr<DiskData> record) {
  const auto key = record.get();
  DiskReadingLane& lane = lanes_.try_emplace(key, record).first->second;
  request->record = std::move(record);
  if (request->isImpatient() && !request->hasBegun && lane.workers() >= maxRunning(lane)) {
    end(request, DiskReadingResult::timedOut);
    return removeIfUnused(lane);
  }
  request->state = DiskReadingRequest::State::waiting;
  lane.line.add(request);
  offerChanged_.notify_all();
  callWorkers(lane);
}

// Ending a request.

void DiskReadingCore::stop(const Request& request, DiskReadingResult result) {
  using State = DiskReadingRequest::State;
  if (request->state == State::ended) return;
  if (request->hasBegun && result == DiskReadingResult::timedOut) return;
  if (request->state != State::running) return end(request, result);
  if (!request->verdict) request->verdict = result;
  *request->isTurnEnded = true;
}

// Of one that does not run.
void DiskReadingCore::end(const Request& request, DiskReadingResult result) {
  if (request->state == DiskReadingRequest::State::waiting) {
    DiskReadingLane& lane = lanes_.at(request->record.get());
    lane.line.remove(*request);
    removeIfUnused(lane);
  }
  settle(request);
  offerChanged_.notify_all();
  callBack(request->options.executor, [task = request->task, result] { task->didEnd(result); });
}

void DiskReadingCore::settle(const Request& request) {
  request->state = DiskReadingRequest::State::ended;
  watch_.cancel(request->timer);
  requests_.erase(request);
}

void DiskReadingCore::endRequestsOf(const Platform::URL& volumeURL) {
  const Lock lock(mutex_);
  lastUnmounts_[volumeURL] = ++unmountCount_;
  const std::vector<Request> all(requests_.begin(), requests_.end());
  for (const Request& request : all)
    if (request->volumeURL == volumeURL) stop(request, DiskReadingResult::vanished);
}

void DiskReadingCore::close() {
  closing_.request_stop();
  Lock lock(mutex_);
  isClosed_ = true;
  const std::vector<Request> all(requests_.begin(), requests_.end());
  for (const Request& request : all) stop(request, DiskReadingResult::stopped);
  const Basalt::ThreadID thread = Basalt::currentThreadID();
  busyChanged_.wait(lock, [&] {
    return std::all_of(busy_.begin(), busy_.end(),
                       [&](Basalt::ThreadID busy) { return busy == thread; });
  });
  lock.unlock();
  unmounts_.reset();
  watch_.close();
  results_.close();
}

}  // namespace Varnel
