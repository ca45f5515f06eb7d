// SPDX-License-Identifier: MIT
#include <Varnel/DiskAccess/DiskReadingWatch.h>

#include <condition_variable>
#include <deque>
#include <map>
#include <mutex>
#include <utility>

#include <Varnel/Platform/Concurrency/StartThread.h>

namespace Varnel {

struct DiskReadingWatch::State {
  void run();
  [[nodiscard]] Basalt::Block nextBlock();

  std::mutex mutex;  ///< Owns what follows.
  std::condition_variable changed;
  std::deque<Basalt::Block> soon;
  std::map<Timer, Basalt::Block> alarms;
  std::uint64_t lastNumber = 0;
  bool isClosed = false;
};

void DiskReadingWatch::State::run() {
  while (Basalt::Block block = nextBlock()) block();
}

// Empty when the watch is closed and nothing is left to do.
Basalt::Block DiskReadingWatch::State::nextBlock() {
  std::unique_lock lock(mutex);
  while (true) {
    if (!soon.empty()) {
      Basalt::Block block = std::move(soon.front());
      soon.pop_front();
      return block;
    }
    if (isClosed) return {};
    if (alarms.empty()) {
      changed.wait(lock);
      continue;
    }
    const Time next = alarms.begin()->first.time;
    if (next <= Time::clock::now()) return std::move(alarms.extract(alarms.begin()).mapped());
    changed.wait_until(lock, next);
  }
}

DiskReadingWatch::DiskReadingWatch(const char* threadName)
    : state_(std::make_shared<State>()),
      thread_(Platform::startThread(threadName, [state = state_] { state->run(); })) {}

void DiskReadingWatch::soon(Basalt::Block block) {
  {
    const std::lock_guard lock(state_->mutex);
    if (!state_->isClosed) {
      state_->soon.push_back(std::move(block));
      state_->changed.notify_one();
      return;
    }
  }
  block();
}

DiskReadingWatch::Timer DiskReadingWatch::at(Time time, Basalt::Block block) {
  const std::lock_guard lock(state_->mutex);
  const Timer timer{time, ++state_->lastNumber};
  state_->alarms.emplace(timer, std::move(block));
  state_->changed.notify_one();
  return timer;
}

void DiskReadingWatch::cancel(Timer timer) {
  std::map<Timer, Basalt::Block>::node_type cancelled;  // Destroyed without the lock.
  const std::lock_guard lock(state_->mutex);
  cancelled = state_->alarms.extract(timer);
}

void DiskReadingWatch::close() {
  std::map<Timer, Basalt::Block> dropped;
  {
    const std::lock_guard lock(state_->mutex);
    if (std::exchange(state_->isClosed, true)) return;
    dropped.swap(state_->alarms);
    state_->changed.notify_one();
  }
  if (thread_.get_id() == std::this_thread::get_id())
    thread_.detach();
  else
    thread_.join();
}

}  // namespace Varnel
