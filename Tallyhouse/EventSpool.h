// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <mutex>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <vector>

#include <Varnel/Platform/SQLite/SQLiteDatabase.h>
#include <Varnel/Platform/Values/Date.h>
#include <Varnel/Tallyhouse/DeliveryPolicy.h>

namespace Varnel::Platform {
class AppendFiles;
class SystemLog;
}  // namespace Varnel::Platform

namespace Tallyhouse {

/// How much may wait. A further event pushes out the oldest.
struct SpoolLimits final {
  std::int64_t maxEvents = 10'000;
  std::int64_t maxBytes = 8 << 20;  ///< Of the events' texts.
};

/// An event in the spool.
struct SpooledEvent final {
  std::int64_t id = 0;
  std::string uuid;
  Varnel::Platform::Date date;
  std::string hit;
};

/// Events on their way, in a file that only the user can read. What `append` has taken survives the
/// end of the process, but not always a loss of power.
///
/// Fresh events wait in line. An event that the server refuses leaves the line, so that it does not
/// hold up the others, and is tried alone until it is set aside for good. All of them count towards
/// the limits.
///
/// Any thread. Nothing throws. A failure of the file is reported to the system's log once, and the
/// events that it would have held count as dropped. A file that cannot be opened is tried again now
/// and then. A damaged file is set aside (as ".damaged") and a new one begun. Two processes may
/// share a file; an event may then be delivered by both.
class EventSpool final {
 public:
  struct Ports {
    Varnel::Platform::AppendFiles& appendFiles;
    Varnel::Platform::SystemLog& systemLog;
  };

  EventSpool(Ports ports, std::string path, SpoolLimits limits);
  EventSpool(const EventSpool&) = delete;
  EventSpool& operator=(const EventSpool&) = delete;

  /// Puts an event at the end of the line and returns how many events wait now.
  std::int64_t append(std::string_view uuid, Varnel::Platform::Date date, std::string_view hit);

  /// The waiting events. An event refused `maxRefusals` times does not count.
  [[nodiscard]] Backlog backlog(int maxRefusals);

  /// The head of the line: at most this many events, and at most this many bytes unless the first
  /// event alone is larger.
  [[nodiscard]] std::vector<SpooledEvent> waiting(std::size_t maxEvents, std::size_t maxBytes);
  /// The oldest event that was refused less than `maxRefusals` times.
  [[nodiscard]] std::optional<SpooledEvent> refused(int maxRefusals);

  /// Removes the events. Returns whether they are gone.
  [[nodiscard]] bool removeWaiting(std::span<const SpooledEvent> events);
  [[nodiscard]] bool removeRefused(const SpooledEvent& event);
  /// Takes the events out of the line as refused once.
  void moveToRefused(std::span<const SpooledEvent> events);
  void countRefusal(const SpooledEvent& event);

  /// Empties the spool, and removes files that were set aside. Until the file allows that, none of
  /// its events is given out and none is taken.
  void clear();

  /// Moves appended events from the log into the file itself. Takes as long as the disk does;
  /// `append` does not wait for it.
  void checkpoint();

  /// Counts an event that could not even be appended.
  void countDropped();

  /// Events pushed out by the limits, too large, or lost to a failing file, since the file was
  /// begun.
  [[nodiscard]] std::int64_t droppedCount();

 private:
  using Database = Varnel::Platform::SQLiteDatabase;
  using Statement = Varnel::Platform::SQLiteStatement;

  // All of these are called with the mutex held.
  void open();
  [[nodiscard]] std::optional<Varnel::Platform::PlatformError> tryToOpen();
  [[nodiscard]] std::optional<Varnel::Platform::PlatformError> damage();
  void putAside();
  [[nodiscard]] bool isCleared();
  void recount();
  void recountIfShared();
  [[nodiscard]] bool copyToRefused(std::span<const SpooledEvent> events);
  void makeRoom(std::int64_t bytes);
  void drop(std::int64_t count);
  [[nodiscard]] std::int64_t removeOldest(const char* table, std::int64_t count);
  void failed(const Varnel::Platform::PlatformError& error);
  [[nodiscard]] bool run(Statement& statement);
  [[nodiscard]] bool run(const std::string& sql);
  [[nodiscard]] std::optional<Statement> prepare(std::string_view sql);
  [[nodiscard]] std::optional<std::int64_t> number(std::string_view sql);
  [[nodiscard]] bool removeEach(std::string_view table, std::span<const SpooledEvent> events);

  const Ports ports_;
  const std::string path_;
  const SpoolLimits limits_;

  std::mutex mutex_;  ///< Owns all below.
  std::optional<Database> database_;
  std::optional<Statement> insert_;
  std::int64_t waitingEvents_ = 0;
  std::int64_t refusedEvents_ = 0;
  std::int64_t bytes_ = 0;
  std::int64_t foreignChanges_ = 0;  ///< Changes with every change by another connection.
  std::int64_t unsavedDropped_ = 0;
  bool mustClear_ = false;
  bool hasReported_ = false;
};

}  // namespace Tallyhouse
