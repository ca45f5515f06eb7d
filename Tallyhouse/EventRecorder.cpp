// SPDX-License-Identifier: MIT
#include <Varnel/Tallyhouse/EventRecorder.h>

#include <algorithm>
#include <random>
#include <tuple>
#include <utility>
#include <vector>

#include <Varnel/Platform/Ports/Clock.h>
#include <Varnel/Platform/Ports/SystemLog.h>
#include <fmt/format.h>

namespace Tallyhouse {

using Varnel::Platform::Date;
using Varnel::Platform::DurableFile;
using Varnel::Platform::SQLiteDatabase;
using Error = std::optional<Varnel::Platform::PlatformError>;

namespace {

Error readEpoch(SQLiteDatabase& database, Date& epoch) {
  epoch = {};
  return database.row("SELECT epoch FROM state", std::tie(epoch));
}

// What is forgotten must not be found in the free parts of the file.
Error empty(SQLiteDatabase& database, Date epoch) {
  if (auto error = database.execute("PRAGMA secure_delete = ON; DELETE FROM event")) return error;
  return database.run(
      "INSERT INTO state(id, epoch) VALUES(1, ?1) ON CONFLICT(id) DO UPDATE SET epoch = ?1", epoch);
}

Error addDropped(SQLiteDatabase& database, std::int64_t count, std::int64_t lastID) {
  return database.run(
      "INSERT INTO state(id, dropped, lost_through) VALUES(1, ?1, ?2) ON CONFLICT(id)"
      " DO UPDATE SET dropped = dropped + ?1, lost_through = max(lost_through, ?2)",
      count, lastID);
}

// The event may be there already: a change is made again when the file was replaced meanwhile. Or
// another process's event has the number.
Error insertOnce(SQLiteDatabase& database, SpooledEvent& event) {
  for (;; event.id += idStep) {
    auto error = database.run("INSERT OR IGNORE INTO event(id, date, uuid, hit) VALUES(?, ?, ?, ?)",
                              event.id, event.date, event.uuid, event.hit);
    if (error || database.changedRows() > 0) return error;
    bool isThere = false;
    error = database.row("SELECT uuid = ? FROM event WHERE id = ?", std::tie(isThere), event.uuid,
                         event.id);
    if (error || isThere) return error;
  }
}

// Other processes write as well, so nobody takes more than an eighth of what is free. A full spool
// loses a hundredth at a time, so that most events find room without a count.
Error trim(SQLiteDatabase& database, const SpoolLimits& limits, SpoolRoom& room) {
  for (;;) {
    std::int64_t events = 0;
    std::int64_t bytes = 0;
    auto error = database.row("SELECT count(*) FROM event", std::tie(events));
    if (!error)
      error = database.row(
          "SELECT (page_count - freelist_count) * page_size FROM"
          " pragma_page_count, pragma_freelist_count, pragma_page_size",
          std::tie(bytes));
    if (error) return error;
    if (events == 0 || (events <= limits.maxEvents && bytes <= limits.maxBytes)) {
      room = {.events = std::max((limits.maxEvents - events) / 8, limits.maxEvents / 100 + 1),
              .bytes = std::max((limits.maxBytes - bytes) / 8, limits.maxBytes / 100 + 1)};
      return std::nullopt;
    }
    std::int64_t last = 0;
    error = database.row("SELECT max(id) FROM (SELECT id FROM event ORDER BY id LIMIT ?)",
                         std::tie(last), events / 100 + 1);
    if (!error) error = database.run("DELETE FROM event WHERE id <= ?", last);
    if (!error) error = addDropped(database, database.changedRows(), last);
    if (error) return error;
  }
}

}  // namespace

// What could not be done yet, and how it went.
struct EventRecorder::Work final {
  std::vector<SpooledEvent> events;
  std::int64_t lastID = 0;
  std::int64_t dropped = 0;
  std::optional<Date> refusal;
  Date epoch;  ///< The file's, afterwards.
  SpoolRoom room;

  Error doIn(SQLiteDatabase& database, const SpoolLimits& limits) {
    auto error = readEpoch(database, epoch);
    if (!error && refusal)
      error = empty(database, epoch = std::max(epoch + Date::duration(1), *refusal));
    for (SpooledEvent& event : events)
      if (!error && (refusal || epoch <= event.epoch)) error = insertOnce(database, event);
    if (!error && dropped > 0) error = addDropped(database, dropped, 0);
    return error ? error : trim(database, limits, room);
  }
};

EventRecorder::EventRecorder(Ports ports, std::string path, SpoolLimits limits)
    : ports_(ports),
      path_(path),
      limits_(limits),
      origin_(std::random_device()() % idStep),
      file_({ports.privateFiles, ports.systemLog}, path, spoolFormat(),
            Varnel::Platform::Migrating::allowed) {}

EventRecorder::~EventRecorder() {
  settle(file_, Haste::none);
  if (lastID_ != origin_) static_cast<void>(isInPlace());
  if (!held_.empty())
    ports_.systemLog.write(fmt::format("{} events are lost: {}", held_.size(), path_));
}

void EventRecorder::begin() {
  const std::lock_guard atFile(fileMutex_);
  Date epoch;
  const auto error =
      file_.read([&](SQLiteDatabase& database) { return readEpoch(database, epoch); });
  const std::lock_guard lock(mutex_);
  own_.epoch = error ? ports_.clock.now() : epoch;
  isRevoked_ = false;
}

std::int64_t EventRecorder::append(std::string_view uuid, Date date, std::string_view hit) {
  const std::lock_guard atFile(fileMutex_);
  SpooledEvent event = named(uuid, date, hit);
  if (event.id == 0) return 0;
  if (mayInsert() && insert(event)) {
    const std::lock_guard lock(mutex_);
    --room_.events;
    room_.bytes -= static_cast<std::int64_t>(event.hit.size());
    return ++waiting_;
  }
  const std::int64_t held = hold(std::move(event));
  settle(file_, Haste::usual);
  return held;
}

SpooledEvent EventRecorder::named(std::string_view uuid, Date date, std::string_view hit) {
  constexpr std::int64_t maxTime = (std::int64_t{1} << 62) / idStep;
  using Tick = std::chrono::duration<std::int64_t, std::ratio<64, 1'000'000>>;
  const auto time = std::chrono::duration_cast<Tick>(date.time_since_epoch());
  const auto id = std::clamp<std::int64_t>(time.count(), 0, maxTime) * idStep + origin_;
  const std::lock_guard lock(mutex_);
  if (isRevoked_) {
    own_.hasLost = true;
    return {};
  }
  lastID_ = std::max(lastID_ + idStep, id);
  if (own_.first == 0) own_.first = lastID_;
  own_.last = lastID_;
  return {.id = lastID_,
          .uuid = std::string(uuid),
          .date = date,
          .hit = std::string(hit),
          .refusals = 0,
          .epoch = own_.epoch};
}

bool EventRecorder::mayInsert() const {
  const std::lock_guard lock(mutex_);
  return held_.empty() && !refusal_ && room_.events > 0 && room_.bytes > 0;
}

// The usual way, for little more than the row itself. Whatever is unusual is left to `settle`.
bool EventRecorder::insert(const SpooledEvent& event) {
  bool isInserted = false;
  const auto write = [&](SQLiteDatabase& database) {
    auto failure = database.run(
        "INSERT OR IGNORE INTO event(id, date, uuid, hit) SELECT ?, ?, ?, ?"
        " WHERE coalesce((SELECT epoch FROM state), 0) <= ?",
        event.id, event.date, event.uuid, event.hit, event.epoch);
    isInserted = !failure && database.changedRows() > 0;
    return failure;
  };
  // The next event, or the deliverer, looks again at whether the file is in its place.
  const auto error = file_.changeByOneStatement(write, DurableFile::Looking::eachMillisecond);
  if (error) {
    const std::lock_guard lock(mutex_);
    pause_.failed(ports_.clock.now());
  }
  return isInserted;
}

std::int64_t EventRecorder::hold(SpooledEvent event) {
  const std::lock_guard lock(mutex_);
  heldBytes_ += event.hit.size();
  held_.push_back(std::move(event));
  while (held_.size() > limits_.maxHeldEvents || heldBytes_ > limits_.maxHeldBytes) {
    heldBytes_ -= held_.front().hit.size();
    held_.pop_front();
    ++dropped_;
    own_.hasLost = true;
  }
  return static_cast<std::int64_t>(held_.size());
}

void EventRecorder::countDropped() {
  const std::lock_guard lock(mutex_);
  ++dropped_;
  own_.hasLost = true;
}

void EventRecorder::discard() {
  const std::lock_guard atFile(fileMutex_);
  const bool isThere = file_.isThere();
  {
    const std::lock_guard lock(mutex_);
    held_.clear();
    heldBytes_ = 0;
    own_ = {};
    refusal_ = isThere ? std::optional(ports_.clock.now()) : std::nullopt;
  }
  settle(file_, Haste::none);
  file_.removeSetAside();
}

std::optional<Date> EventRecorder::settle(DurableFile& file, Haste haste) {
  Work work;
  {
    const std::lock_guard lock(mutex_);
    if (!hasWork()) return std::nullopt;
    const Date now = ports_.clock.now();
    const bool isTooEarly = haste == Haste::usual && !pause_.isOver(now);
    if (!isTooEarly) pause_.failed(now);
    if (isTooEarly || isSettling_) return pause_.end();
    isSettling_ = true;
    work.events.assign(held_.begin(), held_.end());
    work.lastID = lastID_;
    work.dropped = dropped_;
    work.refusal = refusal_;
  }
  const auto error =
      file.change([&](SQLiteDatabase& database) { return work.doIn(database, limits_); });
  // What is forgotten must not be found in the log either.
  if (!error && work.refusal)
    static_cast<void>(file.changeByOneStatement([](SQLiteDatabase& database) {
      return database.execute("PRAGMA wal_checkpoint(TRUNCATE)");
    }));
  const std::lock_guard lock(mutex_);
  isSettling_ = false;
  if (error) return pause_.end();
  pause_.succeeded();
  finish(work);
  return hasWork() ? std::optional(ports_.clock.now()) : std::nullopt;
}

void EventRecorder::finish(const Work& work) {
  dropped_ -= work.dropped;
  for (; !held_.empty() && held_.front().id <= work.lastID; held_.pop_front())
    heldBytes_ -= held_.front().hit.size();
  if (!work.events.empty()) own_.last = lastID_ = std::max(lastID_, work.events.back().id);
  waiting_ += static_cast<std::int64_t>(work.events.size());
  room_ = work.room;
  if (work.refusal) {
    if (refusal_ == work.refusal) refusal_.reset();
    own_.epoch = work.epoch;
  }
  isRevoked_ = work.epoch > own_.epoch;
}

bool EventRecorder::mustEmpty() const {
  const std::lock_guard lock(mutex_);
  return refusal_.has_value();
}

// An event that comes between the two calls counts from 1, and so wakes who looks.
void EventRecorder::looking() {
  const std::lock_guard lock(mutex_);
  waiting_ = 0;
}

void EventRecorder::seen(std::int64_t waiting) {
  const std::lock_guard lock(mutex_);
  waiting_ += waiting;
}

OwnEvents EventRecorder::own() const {
  const std::lock_guard lock(mutex_);
  OwnEvents own = own_;
  own.isHeld = !held_.empty();
  return own;
}

bool EventRecorder::isInPlace() {
  const std::lock_guard atFile(fileMutex_);
  return !file_.read([](SQLiteDatabase&) { return Error(); });
}

void EventRecorder::forget(const OwnEvents& delivered) {
  const std::lock_guard lock(mutex_);
  own_.first = own_.last == delivered.last ? 0 : delivered.last + idStep;
}

std::int64_t EventRecorder::droppedCount() {
  const std::lock_guard atFile(fileMutex_);
  std::int64_t dropped = 0;
  static_cast<void>(file_.read([&](SQLiteDatabase& database) {
    dropped = 0;
    return database.row("SELECT dropped FROM state", std::tie(dropped));
  }));
  const std::lock_guard lock(mutex_);
  return dropped + dropped_;
}

}  // namespace Tallyhouse
