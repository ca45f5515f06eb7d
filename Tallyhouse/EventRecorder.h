// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <deque>
#include <mutex>
#include <optional>
#include <string>
#include <string_view>

#include <Varnel/Tallyhouse/SpoolCounts.h>
#include <Varnel/Tallyhouse/SpoolFormat.h>

namespace Varnel::Platform {
class Clock;
class PrivateFiles;
class SystemLog;
}  // namespace Varnel::Platform

namespace Tallyhouse {

/// How much may wait. Further events push out the oldest.
struct SpoolLimits final {
  std::int64_t maxEvents = 10'000;
  std::int64_t maxBytes = 8 << 20;   ///< Of the file, without what is free in it.
  std::size_t maxHeldEvents = 1000;  ///< In memory, while the file cannot be had.
};

/// How much may be written before the file's events are counted again.
struct SpoolRoom final {
  std::int64_t events = 0;
  std::int64_t bytes = 0;
};

/// Writes the events of this process into the spool. What it has written survives the end of the
/// process, but not always a loss of power.
///
/// While the file cannot be had, be it locked, full, read-only or refused, events are held in
/// memory, and `append` and `settle` write them as soon as that works. What memory cannot hold is
/// given up, the oldest first, and counted.
///
/// Any thread. Nothing throws but for want of memory. No operation waits more than 20 ms for the
/// locks of other processes.
class EventRecorder final {
 public:
  struct Ports {
    Varnel::Platform::PrivateFiles& privateFiles;
    Varnel::Platform::Clock& clock;
    Varnel::Platform::SystemLog& systemLog;
  };

  EventRecorder(Ports ports, const std::string& path, SpoolLimits limits);
  /// Tries for the last time to write what is held, and what lies in a spool that was taken away,
  /// and tells the system's log what is lost.
  ~EventRecorder();
  EventRecorder(const EventRecorder&) = delete;
  EventRecorder& operator=(const EventRecorder&) = delete;

  /// The user has consented now. When a process refuses later on, this one takes no more events.
  void begin();

  /// Takes one event. Returns how many wait now where it was put, in the file or in memory, as far
  /// as this process knows; 0 when it was not taken.
  std::int64_t append(std::string_view uuid, Date date, std::string_view hit);

  /// Counts an event that could not even be appended.
  void countDropped();

  /// Empties the spool and begins a new epoch in it, so that what other processes hold is not
  /// written either; removes files that were set aside. Where the file does not allow that yet,
  /// `settle` goes on trying. Where nothing was ever kept no file is made.
  void discard();

  enum class Haste {
    usual,  ///< Not before the pause after the last failure is over.
    none
  };
  /// Does what could not be done yet. Returns when to call again; absent when all is done.
  std::optional<Date> settle(Haste haste);

  /// Whether nothing is to be sent because the spool is not empty yet, though it should be.
  [[nodiscard]] bool mustEmpty() const;

  /// The file is going to be looked at, and: so many were found waiting.
  void looking();
  void seen(std::int64_t waiting);

  /// Whether all that this process has recorded arrived, whoever delivered it. Carries over what
  /// was appended to a spool that has been taken away.
  [[nodiscard]] bool isAllDelivered();

  /// Events wait that were refused less than `maxRefusals` times.
  [[nodiscard]] SpoolCounts counts(int maxRefusals);

 private:
  // All with the lock held:
  void hold(std::string_view uuid, Date date, std::string_view hit);
  [[nodiscard]] bool insert(const SpooledEvent& event);
  std::optional<Date> doAll(Haste haste);

  const Ports ports_;
  const std::string path_;
  const SpoolLimits limits_;
  const std::int64_t origin_;  ///< The last bits of its events' numbers.

  mutable std::mutex mutex_;  ///< Owns all below, also while it is at the file: so what one thread
                              ///< holds cannot stay in memory for what another one does there.
  DurableFile file_;
  std::deque<SpooledEvent> held_;
  std::int64_t dropped_ = 0;     ///< Not yet counted in the file.
  std::optional<Date> refusal_;  ///< Of the user, here, for which the file is not emptied yet.
  Date epoch_;                   ///< In which it records.
  bool isRevoked_ = false;       ///< Another process has refused since `begin`.
  Varnel::Platform::GrowingPause pause_ = spoolPause;
  SpoolRoom room_;
  std::int64_t waiting_ = 0;
  std::int64_t firstID_ = 0;  ///< Of the events that were not yet seen delivered; 0: none.
  std::int64_t lastID_ = origin_;
  bool hasLost_ = false;  ///< Some had to be given up.
};

}  // namespace Tallyhouse
