// SPDX-License-Identifier: MIT
#include <Varnel/Tallyhouse/EventRecorder.h>

#include <algorithm>
#include <random>
#include <tuple>
#include <utility>

#include <Varnel/Platform/Ports/Clock.h>
#include <Varnel/Platform/Ports/SystemLog.h>
#include <fmt/format.h>

namespace Tallyhouse {

namespace {

Failure readEpoch(SQLiteDatabase& database, Date& epoch) {
  epoch = {};
  return database.row("SELECT epoch FROM state", std::tie(epoch));
}

// What is forgotten must not be found in the free parts of the file.
Failure empty(SQLiteDatabase& database, Date epoch) {
  if (auto error = database.execute("PRAGMA secure_delete = ON; DELETE FROM event")) return error;
  return database.run(
      "INSERT INTO state(id, epoch) VALUES(1, ?1) ON CONFLICT(id) DO UPDATE SET epoch = ?1", epoch);
}

Failure addDropped(SQLiteDatabase& database, std::int64_t count, std::int64_t lastID) {
  return database.run(
      "INSERT INTO state(id, dropped, lost_through) VALUES(1, ?1, ?2) ON CONFLICT(id)"
      " DO UPDATE SET dropped = dropped + ?1, lost_through = max(lost_through, ?2)",
      count, lastID);
}

// The event may be there already: a change is made again when the file was replaced meanwhile. Or
// another process's event has the number.
Failure insertOnce(SQLiteDatabase& database, SpooledEvent& event) {
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
Failure trim(SQLiteDatabase& database, const SpoolLimits& limits, SpoolRoom& room) {
  for (;;) {
    std::int64_t events = 0;
    std::int64_t bytes = 0;
    auto error = database.row(
        "SELECT (SELECT count(*) FROM event), (page_count - freelist_count) * page_size"
        " FROM pragma_page_count, pragma_freelist_count, pragma_page_size",
        std::tie(events, bytes));
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

EventRecorder::EventRecorder(Ports ports, const std::string& path, SpoolLimits limits)
    : ports_(ports),
      path_(path),
      limits_(limits),
      origin_(std::random_device()() % idStep),
      file_({ports.privateFiles, ports.systemLog}, path, spoolFormat(),
            Varnel::Platform::Migrating::allowed) {}

EventRecorder::~EventRecorder() {
  settle(Haste::none);
  if (firstID_ != 0) static_cast<void>(isAllDelivered());
  if (!held_.empty())
    ports_.systemLog.write(fmt::format("{} events are lost: {}", held_.size(), path_));
}

void EventRecorder::begin() {
  const std::lock_guard lock(mutex_);
  const auto error =
      file_.read([&](SQLiteDatabase& database) { return readEpoch(database, epoch_); });
  if (error) epoch_ = ports_.clock.now();
  isRevoked_ = false;
}

std::int64_t EventRecorder::append(std::string_view uuid, Date date, std::string_view hit) {
  const std::lock_guard lock(mutex_);
  if (isRevoked_) {
    hasLost_ = true;
    return 0;
  }
  const bool isAlone = held_.empty() && !refusal_;
  hold(uuid, date, hit);
  if (isAlone && room_.events > 0 && room_.bytes > 0 && insert(held_.back())) {
    held_.clear();
    --room_.events;
    room_.bytes -= static_cast<std::int64_t>(hit.size());
    return ++waiting_;
  }
  if (held_.size() > limits_.maxHeldEvents) {
    held_.pop_front();
    ++dropped_;
    hasLost_ = true;
  }
  doAll(Haste::usual);
  return held_.empty() ? waiting_ : static_cast<std::int64_t>(held_.size());
}

void EventRecorder::hold(std::string_view uuid, Date date, std::string_view hit) {
  constexpr std::int64_t maxTime = (std::int64_t{1} << 62) / idStep;
  using Tick = std::chrono::duration<std::int64_t, std::ratio<64, 1'000'000>>;
  const auto time = std::chrono::duration_cast<Tick>(date.time_since_epoch());
  const auto id = std::clamp<std::int64_t>(time.count(), 0, maxTime) * idStep + origin_;
  held_.push_back({.id = std::max(lastID_ + idStep, id),
                   .uuid = std::string(uuid),
                   .date = date,
                   .hit = std::string(hit),
                   .refusals = 0,
                   .epoch = epoch_});
  lastID_ = held_.back().id;
  if (firstID_ == 0) firstID_ = lastID_;
}

// The usual way, for little more than the row itself. Whatever is unusual is left to `doAll`.
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
  if (file_.changeByOneStatement(write, DurableFile::Looking::eachMillisecond))
    pause_.failed(ports_.clock.now());
  return isInserted;
}

void EventRecorder::countDropped() {
  const std::lock_guard lock(mutex_);
  ++dropped_;
  hasLost_ = true;
}

void EventRecorder::discard() {
  const std::lock_guard lock(mutex_);
  held_.clear();
  firstID_ = 0;
  hasLost_ = false;
  epoch_ = {};
  refusal_ = file_.isThere() ? std::optional(ports_.clock.now()) : std::nullopt;
  doAll(Haste::none);
  file_.removeSetAside();
}

std::optional<Date> EventRecorder::settle(Haste haste) {
  const std::lock_guard lock(mutex_);
  return doAll(haste);
}

std::optional<Date> EventRecorder::doAll(Haste haste) {
  if (!refusal_ && held_.empty() && dropped_ == 0) return std::nullopt;
  if (haste == Haste::usual && !pause_.isOver(ports_.clock.now())) return pause_.end();
  Date epoch;
  const auto error = file_.change([&](SQLiteDatabase& database) {
    auto failure = readEpoch(database, epoch);
    if (!failure && refusal_)
      failure = empty(database, epoch = std::max(epoch + Date::duration(1), *refusal_));
    for (SpooledEvent& event : held_)
      if (!failure && (refusal_ || epoch <= event.epoch)) failure = insertOnce(database, event);
    if (!failure && dropped_ > 0) failure = addDropped(database, dropped_, 0);
    return failure ? failure : trim(database, limits_, room_);
  });
  if (error) {
    pause_.failed(ports_.clock.now());
    return pause_.end();
  }
  pause_.succeeded();
  if (refusal_) {
    epoch_ = epoch;
    refusal_.reset();
    // What is forgotten must not be found in the log either.
    static_cast<void>(file_.changeByOneStatement([](SQLiteDatabase& database) {
      return database.execute("PRAGMA wal_checkpoint(TRUNCATE)");
    }));
  }
  isRevoked_ = epoch > epoch_;
  if (!held_.empty()) lastID_ = held_.back().id;
  waiting_ += static_cast<std::int64_t>(held_.size());
  held_.clear();
  dropped_ = 0;
  return std::nullopt;
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

bool EventRecorder::isAllDelivered() {
  const std::lock_guard lock(mutex_);
  if (hasLost_ || !held_.empty()) return false;
  if (firstID_ == 0) return true;
  bool isDelivered = false;
  // Those that are gone may also have been pushed out, or have been discarded by another process.
  const auto error = file_.read([&](SQLiteDatabase& database) {
    return database.row(
        "SELECT NOT EXISTS (SELECT 1 FROM event WHERE id BETWEEN ?1 AND ?2 AND (id - ?1) % ?4 = 0)"
        " AND NOT EXISTS (SELECT 1 FROM state WHERE lost_through >= ?1 OR epoch > ?3)",
        std::tie(isDelivered), firstID_, lastID_, epoch_, idStep);
  });
  if (error || !isDelivered) return false;
  firstID_ = 0;
  return true;
}

SpoolCounts EventRecorder::counts(int maxRefusals) {
  const std::lock_guard lock(mutex_);
  SpoolCounts counts;
  if (file_.isThere())
    static_cast<void>(file_.read([&](SQLiteDatabase& database) {
      counts = {};
      return database.row(
          "SELECT (SELECT count(*) FROM event WHERE refusals < ?),"
          " coalesce((SELECT dropped FROM state), 0)",
          std::tie(counts.waiting, counts.dropped), maxRefusals);
    }));
  counts.held = static_cast<std::int64_t>(held_.size());
  counts.dropped += dropped_;
  return counts;
}

}  // namespace Tallyhouse
