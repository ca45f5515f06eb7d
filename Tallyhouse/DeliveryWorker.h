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

class EventRecorder;

/// The thread that looks after a spool: it writes what the recorder has to hold, takes a step of
/// the delivery whenever one is due, and moves the spool's log into its file.
///
/// While another process delivers, it looks again after the policy's pause as long as events wait,
/// and every ten minutes when none did.
///
/// Any thread. The thread starts with the first `resume`, or to empty the spool; destruction
/// interrupts a transfer and ends it.
class DeliveryWorker final {
 public:
  DeliveryWorker(Varnel::Platform::Clock& clock, EventRecorder& recorder, EventSpool& spool,
                 Delivery delivery);
  ~DeliveryWorker();
  DeliveryWorker(const DeliveryWorker&) = delete;
  DeliveryWorker& operator=(const DeliveryWorker&) = delete;

  /// Delivers from now on.
  void resume();

  /// Interrupts a transfer and delivers nothing until `resume`.
  void pause();

  /// Tells the thread that there is something new in the spool.
  void wake();

  /// Sends without lingering, and waits until no event is left, the server is to be left alone, or
  /// another process has delivered what this one recorded. Returns whether all that was delivered.
  bool drain(std::chrono::milliseconds timeout);

 private:
  void start();
  void run();
  // The next two are called with the lock held, which is held again on return. Absent: nothing is
  // to be done until something new comes.
  std::optional<Varnel::Platform::Date> work(std::unique_lock<std::mutex>& lock);
  void waitForNext(std::unique_lock<std::mutex>& lock, std::optional<Varnel::Platform::Date> next);
  // Called without it.
  Delivery::Step deliver(Delivery::Haste haste, bool isPaused, const std::stop_token& transfer);

  Varnel::Platform::Clock& clock_;
  EventRecorder& recorder_;
  EventSpool& spool_;  ///< This and the next belong to the thread.
  Delivery delivery_;

  std::mutex mutex_;  ///< Owns all below.
  std::condition_variable changed_;
  bool isAtRest_ = false;
  bool areOwnDelivered_ = false;
  bool isPaused_ = true;
  bool isEnding_ = false;
  bool isWoken_ = false;
  int drainers_ = 0;
  std::int64_t drainsAsked_ = 0;
  std::int64_t drainsSeen_ = 0;  ///< How many were asked for before the step that set the two.
  std::stop_source transfer_;
  std::thread thread_;
};

}  // namespace Tallyhouse
