// SPDX-License-Identifier: MIT
#pragma once

#include <chrono>
#include <condition_variable>
#include <cstdint>
#include <mutex>
#include <optional>
#include <stop_token>
#include <thread>

#include <Varnel/Platform/Values/Date.h>
#include <Varnel/Tallyhouse/Delivery.h>

namespace Varnel::Platform {
class Clock;
}  // namespace Varnel::Platform

namespace Tallyhouse {

/// The thread that delivers a spool: it takes a step of the delivery whenever one is due, and moves
/// the spool's log into its file.
///
/// Any thread. The thread starts with the first `resume`; destruction interrupts a transfer and
/// ends it.
class DeliveryWorker final {
 public:
  DeliveryWorker(Varnel::Platform::Clock& clock, EventSpool& spool, Delivery delivery);
  ~DeliveryWorker();
  DeliveryWorker(const DeliveryWorker&) = delete;
  DeliveryWorker& operator=(const DeliveryWorker&) = delete;

  /// Delivers from now on.
  void resume();

  /// Interrupts a transfer and delivers nothing until `resume`.
  void pause();

  /// Tells the thread that there is something new in the spool.
  void wake();

  /// Sends without lingering, and waits until no event is left or the server has asked for a pause.
  /// Returns whether no event is left.
  bool drain(std::chrono::milliseconds timeout);

 private:
  enum class State { working, idle, blocked };

  void run();
  // Called with the lock held, which is held again on return.
  std::optional<Varnel::Platform::Date> step(std::unique_lock<std::mutex>& lock);
  void waitForNext(std::unique_lock<std::mutex>& lock, std::optional<Varnel::Platform::Date> next);

  Varnel::Platform::Clock& clock_;
  EventSpool& spool_;
  Delivery delivery_;  ///< Belongs to the thread.

  std::mutex mutex_;  ///< Owns all below.
  std::condition_variable changed_;
  State state_ = State::working;
  bool isPaused_ = true;
  bool isEnding_ = false;
  bool isWoken_ = false;
  int drainers_ = 0;
  std::int64_t drainsAsked_ = 0;
  std::int64_t drainsSeen_ = 0;  ///< How many were asked for before the step that made `state_`.
  std::stop_source transfer_;
  std::thread thread_;
};

}  // namespace Tallyhouse
