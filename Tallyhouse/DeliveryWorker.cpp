// SPDX-License-Identifier: MIT
#include <Varnel/Tallyhouse/DeliveryWorker.h>

#include <algorithm>
#include <utility>

#include <Varnel/Platform/Concurrency/StartThread.h>
#include <Varnel/Platform/Ports/Clock.h>
#include <Varnel/Tallyhouse/EventSpool.h>

namespace Tallyhouse {

using Varnel::Platform::Date;

DeliveryWorker::DeliveryWorker(Varnel::Platform::Clock& clock, EventSpool& spool, Delivery delivery)
    : clock_(clock), spool_(spool), delivery_(std::move(delivery)) {}

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
  if (!thread_.joinable()) thread_ = Varnel::Platform::startThread("analytics", [this] { run(); });
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

void DeliveryWorker::wake() {
  const std::lock_guard lock(mutex_);
  isWoken_ = true;
  changed_.notify_all();
}

bool DeliveryWorker::drain(std::chrono::milliseconds timeout) {
  std::unique_lock lock(mutex_);
  const std::int64_t asked = ++drainsAsked_;
  const auto isAnswered = [&] { return drainsSeen_ >= asked && state_ != State::working; };
  ++drainers_;
  isWoken_ = true;
  changed_.notify_all();
  changed_.wait_for(lock, timeout, [&] { return isPaused_ || isAnswered(); });
  --drainers_;
  return isAnswered() && state_ == State::idle;
}

void DeliveryWorker::run() {
  std::unique_lock lock(mutex_);
  while (!isEnding_) {
    isWoken_ = false;
    std::optional<Date> next;
    if (!isPaused_) next = step(lock);
    waitForNext(lock, next);
  }
}

std::optional<Date> DeliveryWorker::step(std::unique_lock<std::mutex>& lock) {
  const std::stop_token transfer = transfer_.get_token();
  const auto haste = drainers_ > 0 ? Delivery::Haste::none : Delivery::Haste::usual;
  const std::int64_t drainsAsked = drainsAsked_;
  lock.unlock();
  const std::optional<Date> next = delivery_.step(haste, transfer);
  const bool isDueLater = next && *next > clock_.now();
  lock.lock();
  drainsSeen_ = drainsAsked;
  state_ = !next ? State::idle : isDueLater ? State::blocked : State::working;
  changed_.notify_all();
  return next;
}

void DeliveryWorker::waitForNext(std::unique_lock<std::mutex>& lock, std::optional<Date> next) {
  // The wall clock may jump, while the wait counts the time that passes. Another process may leave
  // events behind as well.
  constexpr Date::duration maxWait = std::chrono::minutes(10);
  const auto wait = next ? std::min(*next - clock_.now(), maxWait) : maxWait;
  if (wait <= Date::duration::zero() || isWoken_ || isEnding_) return;
  // Before a long wait, so that an idle spool is one small file.
  lock.unlock();
  spool_.checkpoint();
  lock.lock();
  changed_.wait_for(lock, wait, [this] { return isWoken_ || isEnding_; });
}

}  // namespace Tallyhouse
