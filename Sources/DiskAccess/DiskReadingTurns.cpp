// SPDX-License-Identifier: MIT
#include <algorithm>
#include <numeric>
#include <system_error>
#include <utility>

#include <Varnel/DiskAccess/DiskReadingCore.h>
#include <Varnel/DiskAccess/OVDiskInfo.h>
#include <Varnel/Platform/Ports/ReadingPriority.h>

// How the queue's workers get to the disks and what they do there.

namespace Varnel {
namespace {

using namespace std::chrono_literals;

/// How long a request whose executor is slow to begin stays out of the line at last. It starts with
/// the time of a turn, and doubles.
constexpr std::chrono::milliseconds maxPause = 1s;

constexpr std::chrono::milliseconds timeWithoutThreads = 100ms;

DiskReadingLine::Seeks seeksOf(const OVDiskInfo& disk) {
  return disk.kind() == OVDiskKindSolidState ? DiskReadingLine::Seeks::costNothing
                                             : DiskReadingLine::Seeks::costTime;
}

}  // namespace

/// The priority of a thread that serves the queue: lowered while it serves the low classes.
class DiskReadingCore::PriorityOfThread final {
 public:
  PriorityOfThread(Platform::ReadingPriority& priority,
                   std::optional<Platform::ReadingPriority::Level> normal)
      : priority_(priority), normal_(normal) {}

  void follow(int urgency) {
    const bool isLow = urgency >= urgencyClassOf(Platform::QualityOfService::utility);
    if (!normal_ || isLow == std::exchange(isLow_, isLow)) return;
    priority_.set(isLow ? priority_.lowered(*normal_) : *normal_);
  }
  void restore() { follow(0); }

 private:
  Platform::ReadingPriority& priority_;
  const std::optional<Platform::ReadingPriority::Level> normal_;
  bool isLow_ = false;
};

// Turns.

DiskReadingTurn::DiskReadingTurn(const Now& now, const std::atomic<bool>& isEnded)
    : now_(now), isEnded_(isEnded), end_(now() + maxTime) {}

bool DiskReadingTurn::isOver() const {
  return byteCount_ >= maxBytes || isEnded_.load(std::memory_order_relaxed) || now_() >= end_;
}

// Lanes.

DiskReadingLane::DiskReadingLane(std::shared_ptr<DiskData> theRecord)
    : record(std::move(theRecord)), line(seeksOf(*record->diskInfo())) {}

std::int64_t DiskReadingLane::applicants() const {
  return std::accumulate(applying.begin(), applying.end(), std::int64_t{0});
}

/// What a worker asks admission for.
struct DiskReadingCore::Application {
  int urgency;
  DiskAccessState::Access access;
};

/// A worker's time with a lane, on the worker's stack.
struct DiskReadingCore::Stay {
  DiskReadingLane& lane;
  PriorityOfThread priority;
  int urgency = 0;  ///< In which it was admitted.
  std::unique_ptr<DiskAccessingSession> session{};
  std::unique_ptr<Platform::SessionBoard::Place> sharedPlace{};
  std::atomic<bool> isTurnEnded = false;
  enum class Offer { open, taken, done };
  Offer offer = Offer::open;  ///< What has become of the place on the executor.
  const Basalt::ThreadID thread = Basalt::currentThreadID();
};

std::int64_t DiskReadingCore::maxRunning(const DiskReadingLane& lane) const {
  const std::int64_t admitted = lane.record->diskInfo()->maxTreads();
  return std::min(admitted, disks_->isBackgroundMode() ? 1 : maxWorkers);
}

// The class in which one more worker is to apply. A worker that applies in a lower class cannot
// serve a request, and others may keep it waiting: then the request gets a worker of its own.
std::optional<int> DiskReadingCore::classToApplyFor(const DiskReadingLane& lane) const {
  const auto urgency = lane.line.urgency();
  if (!urgency || lane.running >= maxRunning(lane)) return std::nullopt;
  const auto waiting = static_cast<std::int64_t>(lane.line.size());
  if (lane.workers() < maxRunning(lane) && waiting > lane.starting + lane.applicants())
    return urgency;
  const auto end = lane.applying.begin() + *urgency + 1;
  const bool isServed = lane.starting > 0 || std::any_of(lane.applying.begin(), end,
                                                         [](auto count) { return count > 0; });
  return isServed ? std::nullopt : urgency;
}

void DiskReadingCore::callWorkers(DiskReadingLane& lane) {
  while (classToApplyFor(lane)) {
    ++lane.starting;
    try {
      workers_->run([self = shared_from_this(), &lane] { self->serve(lane); });
    } catch (const std::system_error&) {
      --lane.starting;
      return callWorkersLater(lane);
    }
  }
}

void DiskReadingCore::callWorkersLater(const DiskReadingLane& lane) {
  (void)watch_.at(DiskReadingWatch::Time::clock::now() + timeWithoutThreads,
                  [weak = weak_from_this(), record = lane.record] {
                    const auto self = weak.lock();
                    if (!self) return;
                    const Lock lock(self->mutex_);
                    const auto found = self->lanes_.find(record.get());
                    if (found != self->lanes_.end()) self->callWorkers(found->second);
                  });
}

// A worker that comes from admission after the queue was closed finds nothing to do, and must not
// touch the ports.
void DiskReadingCore::serve(DiskReadingLane& lane) {
  Stay stay{.lane = lane, .priority = {ports_.readingPriority, normalPriority_}};
  // Without an application the worker is not counted any more, and the lane may go.
  const auto applyOrLeave = [&] {
    auto application = apply(lane);
    callWorkers(lane);
    if (application)
      stay.priority.follow(application->urgency);
    else if (removeIfUnused(lane); !isClosed_)
      stay.priority.restore();
    return application;
  };
  const auto sharedName = sharedNameOf(*lane.record);
  Lock lock(mutex_);
  --lane.starting;
  if (!isClosed_) forgetInheritedPriority();
  auto application = applyOrLeave();
  while (application) {
    lock.unlock();
    stay.urgency = application->urgency;
    Admission admission = admit(lane.record, sharedName, application->access);
    stay.session = std::move(admission.session);
    stay.sharedPlace = std::move(admission.place);
    lock.lock();
    if (!stay.session) endImpatientRequests(lane);
    --lane.applying[static_cast<std::size_t>(stay.urgency)];
    if (stay.session) takeTurn(lock, stay);
    // Before it leaves the disk, so that nobody else is called for the work that it goes on with.
    application = applyOrLeave();
    if (!stay.session && !stay.sharedPlace) continue;
    lock.unlock();
    if (stay.session) stay.session->endAccessing();
    stay.session.reset();
    stay.sharedPlace.reset();
    lock.lock();
  }
}

// A thread has the priority of the one that started it, perhaps while that served a low class.
void DiskReadingCore::forgetInheritedPriority() {
  if (normalPriority_ && ports_.readingPriority.current() != normalPriority_)
    ports_.readingPriority.set(*normalPriority_);
}

std::optional<DiskReadingCore::Application> DiskReadingCore::apply(DiskReadingLane& lane) {
  const auto urgency = classToApplyFor(lane);
  if (!urgency) return std::nullopt;
  ++lane.applying[static_cast<std::size_t>(*urgency)];
  const DiskReadingRequest& request = *lane.line.next(*urgency);
  return Application{
      .urgency = *urgency,
      .access = {.volumeURL = *request.volumeURL,
                 .url = request.file.url,
                 .propose = request.options.propose,
                 .qos = request.options.qos,
                 .enableSecureScopedAccess = false,
                 .waitingTimeout = request.isImpatient() && !request.hasBegun ? std::optional(0.0)
                                                                              : std::nullopt}};
}

// The disk has no place free.
void DiskReadingCore::endImpatientRequests(const DiskReadingLane& lane) {
  const std::vector<Request> all(requests_.begin(), requests_.end());
  for (const Request& request : all)
    if (request->state == DiskReadingRequest::State::waiting && request->record == lane.record &&
        request->isImpatient() && !request->hasBegun)
      end(request, DiskReadingResult::timedOut);
}

void DiskReadingCore::removeIfUnused(const DiskReadingLane& lane) {
  if (lane.line.size() == 0 && lane.workers() == 0) lanes_.erase(lane.record.get());
}

// A worker's turn on the disk, with as many requests as it has time for.
void DiskReadingCore::takeTurn(Lock& lock, Stay& stay) {
  DiskReadingLane& lane = stay.lane;
  if (isClosed_ || lane.running >= maxRunning(lane)) return;
  ++lane.running;
  if (const Request request = runRequests(lock, stay)) offer(lock, request, stay);
  --lane.running;
}

// Returns one that is to run elsewhere. It gets a turn of its own.
DiskReadingCore::Request DiskReadingCore::runRequests(Lock& lock, Stay& stay) {
  busy_.push_back(stay.thread);
  stay.isTurnEnded = false;
  DiskReadingTurn turn(ports_.now, stay.isTurnEnded);
  Request request = nextRequest(lock, stay, true);
  while (request && !request->options.executor) {
    begin(*request, stay.isTurnEnded);
    run(lock, request, turn, stay.priority);
    const bool wantsAnotherTurn = request->state != DiskReadingRequest::State::ended;
    request.reset();
    stay.isTurnEnded = false;
    // A callback that closed the queue was its last, and the ports may be gone.
    if (isClosed_ || wantsAnotherTurn || turn.isOver() || stay.lane.running > maxRunning(stay.lane))
      break;
    request = nextRequest(lock, stay, false);
  }
  leaveBusy(stay.thread);
  return request;
}

DiskReadingCore::Request DiskReadingCore::nextRequest(Lock& lock, Stay& stay, bool isFirst) {
  while (const Request next = stay.lane.line.next(stay.urgency)) {
    if (next->options.executor && !isFirst) return nullptr;
    const Request request = stay.lane.line.take(stay.urgency);
    request->state = DiskReadingRequest::State::placing;
    lock.unlock();
    // Since it came, the volume may have become known, or be another one's.
    auto record = disks_->settledRecordOfVolume(*request->volumeURL);
    lock.lock();
    if (request->state == DiskReadingRequest::State::ended) continue;
    if (record == stay.lane.record) return request;
    enqueue(request, std::move(record));
  }
  return nullptr;
}

void DiskReadingCore::begin(DiskReadingRequest& request, std::atomic<bool>& isTurnEnded) {
  request.state = DiskReadingRequest::State::running;
  request.isTurnEnded = &isTurnEnded;
  if (!request.hasBegun) watch_.cancel(request.timer);
  request.hasBegun = true;
}

// A request that wants another turn goes back to the line. The worker sees it there.
void DiskReadingCore::run(Lock& lock, const Request& request, DiskReadingTurn& turn,
                          PriorityOfThread& priority) {
  lock.unlock();
  priority.follow(request->urgency);
  const DiskReadingNext next = request->task->run(turn);
  lock.lock();
  request->isTurnEnded = nullptr;
  if (next.isAgain() && !request->verdict) {
    request->place = next.place();
    request->state = DiskReadingRequest::State::waiting;
    lanes_.at(request->record.get()).line.add(request);
  } else {
    settle(request);
    lock.unlock();
    if (!next.isAgain())
      request->task->didEnd(DiskReadingResult::read);
    else
      callBack(request->options.executor,
               [task = request->task, verdict = *request->verdict] { task->didEnd(verdict); });
    lock.lock();
  }
}

void DiskReadingCore::leaveBusy(Basalt::ThreadID thread) {
  busy_.erase(std::find(busy_.begin(), busy_.end(), thread));
  busyChanged_.notify_all();
}

// Turns on an executor.

// No place is kept beyond a turn's time while the executor is busy: it might be waiting for that
// very place. Nor is it kept from somebody more urgent.
void DiskReadingCore::offer(Lock& lock, const Request& request, Stay& stay) {
  request->state = DiskReadingRequest::State::offered;
  stay.offer = Stay::Offer::open;
  lock.unlock();
  bool isAccepted = true;
  try {
    request->options.executor->execute(
        [self = shared_from_this(), request, &stay] { self->runOffered(request, stay); });
  } catch (const std::system_error&) {
    isAccepted = false;
  }
  lock.lock();
  const auto isOpen = [&] {
    return stay.offer == Stay::Offer::open && request->state != DiskReadingRequest::State::ended;
  };
  const auto isOutranked = [&] {
    const auto urgency = stay.lane.line.urgency();
    return urgency && *urgency < request->urgency && stay.lane.running >= maxRunning(stay.lane);
  };
  if (isAccepted)
    offerChanged_.wait_for(lock, DiskReadingTurn::maxTime,
                           [&] { return !isOpen() || isOutranked(); });
  if (isOpen()) {
    if (!isOutranked())
      request->pause = std::clamp(2 * request->pause, DiskReadingTurn::maxTime, maxPause);
    request->state = DiskReadingRequest::State::putOff;
    if (!isAccepted) enqueueAfterPause(request);
  } else if (stay.offer == Stay::Offer::taken) {
    request->pause = {};
    offerChanged_.wait(lock, [&] { return stay.offer == Stay::Offer::done; });
  }
}

void DiskReadingCore::enqueueAfterPause(const Request& request) {
  if (request->pause == 0ms) return enqueue(request, request->record);
  (void)watch_.at(DiskReadingWatch::Time::clock::now() + request->pause,
                  [weak = weak_from_this(), request] {
                    const auto self = weak.lock();
                    if (!self) return;
                    const Lock lock(self->mutex_);
                    if (request->state == DiskReadingRequest::State::putOff)
                      self->enqueue(request, request->record);
                  });
}

// On the executor. The stay is still there only if the offer is.
void DiskReadingCore::runOffered(const Request& request, Stay& stay) {
  Lock lock(mutex_);
  if (request->state == DiskReadingRequest::State::putOff) return enqueueAfterPause(request);
  if (request->state != DiskReadingRequest::State::offered) return;
  const Basalt::ThreadID thread = Basalt::currentThreadID();
  busy_.push_back(thread);
  begin(*request, stay.isTurnEnded);
  stay.offer = Stay::Offer::taken;
  offerChanged_.notify_all();
  lock.unlock();
  stay.session->passFrom(stay.thread);
  PriorityOfThread priority(ports_.readingPriority, ports_.readingPriority.current());
  DiskReadingTurn turn(ports_.now, stay.isTurnEnded);
  lock.lock();
  run(lock, request, turn, priority);
  priority.restore();
  lock.unlock();
  stay.session->endAccessing();
  stay.session.reset();
  lock.lock();
  leaveBusy(thread);
  stay.offer = Stay::Offer::done;
  offerChanged_.notify_all();
}

}  // namespace Varnel
