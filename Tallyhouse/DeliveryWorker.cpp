// SPDX-License-Identifier: MIT
#include <Varnel/Tallyhouse/DeliveryWorker.h>

#include <algorithm>
#include <utility>

#include <Varnel/Platform/Concurrency/StartThread.h>
#include <Varnel/Platform/Ports/Clock.h>
#include <Varnel/Tallyhouse/EventRecorder.h>
#include <Varnel/Tallyhouse/EventSpool.h>

namespace Tallyhouse {

using Haste = Delivery::Haste;
using State = Delivery::State;

namespace {

// How soon a drain sees that another process has delivered its events, or died, or freed the file.
constexpr auto drainingPause = std::chrono::milliseconds(50);

std::optional<Date> earlier(std::optional<Date> one, std::optional<Date> other) {
  return one && other ? std::min(one, other) : one ? one : other;
}

}  // namespace

DeliveryWorker::DeliveryWorker(Varnel::Platform::Clock& clock, EventRecorder& recorder,
                               EventSpool& spool, Delivery delivery)
    : clock_(clock), recorder_(recorder), spool_(spool), delivery_(std::move(delivery)) {}

DeliveryWorker::~DeliveryWorker() {
  {
    const std::lock_guard lock(mutex_);
    isEnding_ = true;
    transfer_.request_stop();
    changed_.notify_all();
  }
  if (thread_.joinable()) thread_.join();
}

void DeliveryWorker::resume() {
  const std::lock_guard lock(mutex_);
  if (!isPaused_) return;
  transfer_ = std::stop_source();
  start();
  isPaused_ = false;
  isWoken_ = true;
  changed_.notify_all();
}

void DeliveryWorker::pause() {
  const std::lock_guard lock(mutex_);
  isPaused_ = true;
  transfer_.request_stop();
  changed_.notify_all();
}

void DeliveryWorker::start() {
  if (!thread_.joinable()) thread_ = Varnel::Platform::startThread("analytics", [this] { run(); });
}

void DeliveryWorker::wake() {
  const std::lock_guard lock(mutex_);
  if (!thread_.joinable() && recorder_.mustEmpty()) start();
  isWoken_ = true;
  changed_.notify_all();
}

bool DeliveryWorker::drain(std::chrono::milliseconds timeout) {
  std::unique_lock lock(mutex_);
  const std::int64_t asked = ++drainsAsked_;
  const auto isAnswered = [&] { return drainsSeen_ >= asked && (isAtRest_ || areOwnDelivered_); };
  ++drainers_;
  isWoken_ = true;
  changed_.notify_all();
  changed_.wait_for(lock, timeout, [&] { return isPaused_ || isAnswered(); });
  --drainers_;
  return !isPaused_ && isAnswered() && areOwnDelivered_;
}

void DeliveryWorker::run() {
  std::unique_lock lock(mutex_);
  while (!isEnding_) {
    isWoken_ = false;
    waitForNext(lock, work(lock));
  }
  lock.unlock();
  delivery_.finish();
}

std::optional<Date> DeliveryWorker::work(std::unique_lock<std::mutex>& lock) {
  const std::stop_token transfer = transfer_.get_token();
  const auto haste = drainers_ > 0 ? Haste::none : Haste::usual;
  const std::int64_t drainsAsked = drainsAsked_;
  const bool isPaused = isPaused_;
  lock.unlock();
  const auto unsettled = recorder_.settle(haste == Haste::none ? EventRecorder::Haste::none
                                                               : EventRecorder::Haste::usual);
  const Delivery::Step step = deliver(haste, isPaused, transfer);
  const bool areOwnDelivered = recorder_.isAllDelivered();
  lock.lock();
  drainsSeen_ = drainsAsked;
  // Otherwise there is more to be had without the server: from this process, from the one that
  // delivers, or from the file when it can be had again.
  isAtRest_ = !unsettled && (step.state == State::idle || step.state == State::later);
  areOwnDelivered_ = areOwnDelivered && step.state != State::due;
  changed_.notify_all();
  if (drainers_ > 0 && !isAtRest_ && step.state != State::due) return clock_.now() + drainingPause;
  return earlier(step.next, unsettled);
}

Delivery::Step DeliveryWorker::deliver(Haste haste, bool isPaused,
                                       const std::stop_token& transfer) {
  // What is to be forgotten is not sent.
  if (isPaused || recorder_.mustEmpty()) {
    delivery_.rest();
    return {};
  }
  recorder_.looking();
  const Delivery::Step step = delivery_.step(haste, transfer);
  recorder_.seen(step.waiting);
  return step;
}

void DeliveryWorker::waitForNext(std::unique_lock<std::mutex>& lock, std::optional<Date> next) {
  // The wall clock may jump, while the wait counts the time that passes. Another process may leave
  // events behind as well.
  constexpr Date::duration maxWait = std::chrono::minutes(10);
  const auto wait = next ? std::min(*next - clock_.now(), maxWait) : maxWait;
  if (wait <= Date::duration::zero() || isWoken_ || isEnding_) return;
  // Before a long wait, so that an idle spool is one small file.
  lock.unlock();
  spool_.file().checkpoint();
  lock.lock();
  changed_.wait_for(lock, wait, [this] { return isWoken_ || isEnding_; });
}

}  // namespace Tallyhouse
