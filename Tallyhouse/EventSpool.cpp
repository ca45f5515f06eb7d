// SPDX-License-Identifier: MIT
#include <Varnel/Tallyhouse/EventSpool.h>

#include <algorithm>
#include <bit>
#include <filesystem>
#include <utility>

#include <Varnel/Platform/Ports/AppendFiles.h>
#include <Varnel/Platform/Ports/SystemLog.h>
#include <fmt/format.h>

namespace Tallyhouse {

namespace fs = std::filesystem;
using Varnel::Platform::Date;
using Varnel::Platform::PlatformError;
using Step = Varnel::Platform::SQLiteStatement::Step;

namespace {

// Another process may hold the lock for one short change.
constexpr auto maxLockWait = std::chrono::milliseconds(500);

// With the write-ahead log and this degree of synchronisation a change costs no wait for the disk,
// and what a process has written outlives it. Moving the log into the file does wait; that is left
// to `checkpoint`, unless nobody calls it.
constexpr const char* setUp =
    "PRAGMA journal_mode = WAL; PRAGMA synchronous = NORMAL; PRAGMA wal_autocheckpoint = 8000;";

constexpr std::int64_t schemaVersion = 1;
constexpr const char* schema =
    "BEGIN IMMEDIATE;"
    "CREATE TABLE IF NOT EXISTS waiting(id INTEGER PRIMARY KEY, uuid TEXT NOT NULL, date INTEGER "
    "NOT NULL,"
    " hit TEXT NOT NULL);"
    "CREATE TABLE IF NOT EXISTS refused(id INTEGER PRIMARY KEY, uuid TEXT NOT NULL, date INTEGER "
    "NOT NULL,"
    " hit TEXT NOT NULL, times INTEGER NOT NULL);"
    "CREATE TABLE IF NOT EXISTS counter(dropped INTEGER NOT NULL);"
    "INSERT INTO counter SELECT 0 WHERE NOT EXISTS (SELECT 1 FROM counter);"
    "PRAGMA user_version = 1;"
    "COMMIT;";

SpooledEvent currentEvent(Varnel::Platform::SQLiteStatement& row) {
  return {.id = row.integer(0).value_or(0),
          .uuid = std::string(row.text(1).value_or("")),
          .date = Date(Date::duration(row.integer(2).value_or(0))),
          .hit = std::string(row.text(3).value_or(""))};
}

bool isDamage(const PlatformError& error) {
  constexpr long corrupt = 11;
  constexpr long noDatabase = 26;
  const long primary = error.code() & 0xFF;
  return primary == corrupt || primary == noDatabase;
}

constexpr const char* besideSuffix = ".damaged";
constexpr std::string_view ownDomain = "Tallyhouse.EventSpool";

PlatformError unusable(const char* why) {
  return PlatformError(
      std::string(ownDomain), 1,
      {{std::string(Varnel::Platform::localizedDescriptionKey), std::string(why)}});
}

}  // namespace

EventSpool::EventSpool(Ports ports, std::string path, SpoolLimits limits)
    : ports_(ports), path_(std::move(path)), limits_(limits) {
  const std::lock_guard lock(mutex_);
  open();
}

void EventSpool::open() {
  auto error = tryToOpen();
  if (error && (isDamage(*error) || error->domain() == ownDomain)) {
    putAside();
    error = tryToOpen();
  }
  if (error) failed(*error);
}

std::optional<PlatformError> EventSpool::tryToOpen() {
  std::error_code ignored;
  fs::create_directories(fs::path(path_).parent_path(), ignored);
  // The library would create the file readable for others; its temporary files take over the rights
  // of this one. A file that exists is not opened here: closing it would release this process's
  // locks on it.
  if (!fs::exists(path_, ignored)) {
    if (auto file = ports_.appendFiles.open(path_); !file) return PlatformError(file.error());
  }
  fs::permissions(path_, fs::perms::owner_read | fs::perms::owner_write, ignored);

  auto database = Database::open(path_, Database::Access::readWrite);
  if (!database) return database.error();
  database_.emplace(std::move(database).value());
  database_->setBusyTimeout(maxLockWait);
  auto error = database_->execute(setUp);
  if (!error) error = damage();
  if (!error) {
    const auto version = number("PRAGMA user_version");
    if (!version)
      error = PlatformError(std::make_error_code(std::errc::io_error));
    else if (version == 0)
      error = database_->execute(schema);
    else if (version != schemaVersion)
      error = unusable("the file is of another version");
  }
  if (!error) {
    auto insert = database_->prepare("INSERT INTO waiting(uuid, date, hit) VALUES(?, ?, ?)");
    if (insert)
      insert_.emplace(std::move(insert).value());
    else
      error = insert.error();
  }
  if (error)
    database_.reset();
  else
    recount();
  return error;
}

// A check that fails says nothing about the file: it may be locked.
std::optional<PlatformError> EventSpool::damage() {
  auto check = database_->prepare("PRAGMA quick_check(1)");
  if (!check) return check.error();
  const auto step = check->step();
  if (!step) return step.error();
  if (*step == Step::row && check->text(0) == "ok") return std::nullopt;
  return unusable("the file is damaged");
}

void EventSpool::putAside() {
  insert_.reset();
  database_.reset();
  std::error_code ignored;
  fs::rename(path_, path_ + besideSuffix, ignored);
  // The log may hold most of the events.
  fs::rename(path_ + "-wal", path_ + besideSuffix + "-wal", ignored);
  fs::remove(path_ + "-shm", ignored);
}

std::int64_t EventSpool::append(std::string_view uuid, Date date, std::string_view hit) {
  const std::lock_guard lock(mutex_);
  const auto size = static_cast<std::int64_t>(hit.size());
  // The file may have been locked, so opening is tried again. Ever more rarely, because it is slow.
  if (!insert_ && std::has_single_bit(static_cast<std::uint64_t>(unsavedDropped_) + 1)) open();
  if (!insert_ || !isCleared()) {
    drop(1);
    return waitingEvents_;
  }
  makeRoom(size);
  insert_->bind(1, uuid);
  insert_->bind(2, date.time_since_epoch().count());
  insert_->bind(3, hit);
  if (run(*insert_)) {
    ++waitingEvents_;
    bytes_ += size;
  } else {
    drop(1);
  }
  return waitingEvents_;
}

Backlog EventSpool::backlog(int maxRefusals) {
  const std::lock_guard lock(mutex_);
  Backlog backlog;
  if (!isCleared()) return backlog;
  recountIfShared();
  if (const auto oldest = number("SELECT date FROM waiting ORDER BY id LIMIT 1")) {
    backlog.oldest = Date(Date::duration(*oldest));
    backlog.waiting = std::max<std::int64_t>(waitingEvents_, 1);
  }
  backlog.hasRefused =
      number(fmt::format("SELECT 1 FROM refused WHERE times < {} LIMIT 1", maxRefusals))
          .has_value();
  return backlog;
}

std::vector<SpooledEvent> EventSpool::waiting(std::size_t maxEvents, std::size_t maxBytes) {
  const std::lock_guard lock(mutex_);
  std::vector<SpooledEvent> found;
  auto rows = prepare("SELECT id, uuid, date, hit FROM waiting ORDER BY id LIMIT ?");
  if (!rows) return found;
  rows->bind(1, static_cast<std::int64_t>(maxEvents));
  std::size_t size = 0;
  for (auto step = rows->step();; step = rows->step()) {
    if (!step) failed(step.error());
    if (!step || *step == Step::done) return found;
    SpooledEvent event = currentEvent(*rows);
    size += event.hit.size();
    if (size > maxBytes && !found.empty()) return found;
    found.push_back(std::move(event));
  }
}

std::optional<SpooledEvent> EventSpool::refused(int maxRefusals) {
  const std::lock_guard lock(mutex_);
  auto rows =
      prepare("SELECT id, uuid, date, hit FROM refused WHERE times < ? ORDER BY times, id LIMIT 1");
  if (!rows) return std::nullopt;
  rows->bind(1, static_cast<std::int64_t>(maxRefusals));
  const auto step = rows->step();
  if (!step) failed(step.error());
  if (!step || *step == Step::done) return std::nullopt;
  return currentEvent(*rows);
}

bool EventSpool::removeWaiting(std::span<const SpooledEvent> events) {
  const std::lock_guard lock(mutex_);
  const bool isDone = run("BEGIN IMMEDIATE") && removeEach("waiting", events) && run("COMMIT");
  if (!isDone) recount();
  return isDone;
}

bool EventSpool::removeRefused(const SpooledEvent& event) {
  const std::lock_guard lock(mutex_);
  const bool isDone = removeEach("refused", {&event, 1});
  if (!isDone) recount();
  return isDone;
}

void EventSpool::moveToRefused(std::span<const SpooledEvent> events) {
  const std::lock_guard lock(mutex_);
  // A failure ends the transaction: nothing may be removed that was not copied.
  static_cast<void>(run("BEGIN IMMEDIATE") && copyToRefused(events) &&
                    removeEach("waiting", events) && run("COMMIT"));
  recount();
}

bool EventSpool::copyToRefused(std::span<const SpooledEvent> events) {
  // Copied from the table of waiting events: events that were cleared meanwhile must not come back.
  auto copy = prepare(
      "INSERT INTO refused(uuid, date, hit, times)"
      " SELECT uuid, date, hit, 1 FROM waiting WHERE id = ? AND uuid = ?");
  if (!copy) return false;
  for (const SpooledEvent& event : events) {
    copy->bind(1, event.id);
    copy->bind(2, event.uuid);
    if (!run(*copy)) return false;
  }
  return true;
}

void EventSpool::countRefusal(const SpooledEvent& event) {
  const std::lock_guard lock(mutex_);
  auto update = prepare("UPDATE refused SET times = times + 1 WHERE id = ? AND uuid = ?");
  if (!update) return;
  update->bind(1, event.id);
  update->bind(2, event.uuid);
  static_cast<void>(run(*update));
}

void EventSpool::clear() {
  const std::lock_guard lock(mutex_);
  std::error_code ignored;
  for (const char* suffix : {"", "-wal"}) fs::remove(path_ + besideSuffix + suffix, ignored);
  mustClear_ = true;
  static_cast<void>(isCleared());
}

// Whether a `clear` has been obeyed, which is tried again here.
bool EventSpool::isCleared() {
  if (!mustClear_) return true;
  if (!insert_) open();
  mustClear_ = !run(
      "PRAGMA secure_delete = ON; BEGIN IMMEDIATE; DELETE FROM waiting; DELETE FROM refused;"
      "COMMIT; PRAGMA secure_delete = OFF");
  if (!mustClear_) static_cast<void>(run("PRAGMA wal_checkpoint(TRUNCATE)"));
  recount();
  return !mustClear_;
}

void EventSpool::checkpoint() {
  // A connection of its own, so that nobody waits for the disk behind the mutex. It must not make a
  // file that others can read.
  if (std::error_code ignored; !fs::exists(path_, ignored)) return;
  auto database = Database::open(path_, Database::Access::readWrite);
  if (database) static_cast<void>(database->execute("PRAGMA wal_checkpoint(PASSIVE)"));
}

void EventSpool::countDropped() {
  const std::lock_guard lock(mutex_);
  drop(1);
}

std::int64_t EventSpool::droppedCount() {
  const std::lock_guard lock(mutex_);
  return number("SELECT dropped FROM counter").value_or(0) + unsavedDropped_;
}

void EventSpool::recount() {
  waitingEvents_ = number("SELECT count(*) FROM waiting").value_or(0);
  refusedEvents_ = number("SELECT count(*) FROM refused").value_or(0);
  bytes_ = number(
               "SELECT total(length(hit)) FROM"
               " (SELECT hit FROM waiting UNION ALL SELECT hit FROM refused)")
               .value_or(0);
}

// Another process may have added events, or delivered ours.
void EventSpool::recountIfShared() {
  const auto changes = number("PRAGMA data_version");
  if (!changes || std::exchange(foreignChanges_, *changes) == *changes) return;
  recount();
}

// A full spool loses a hundredth at a time, so that most events find room without a search.
void EventSpool::makeRoom(std::int64_t bytes) {
  const auto isFull = [&] {
    return waitingEvents_ + refusedEvents_ >= limits_.maxEvents ||
           bytes_ + bytes > limits_.maxBytes;
  };
  if (!isFull()) return;
  recount();
  const std::int64_t atOnce = std::max<std::int64_t>(limits_.maxEvents / 100, 1);
  while (isFull() && waitingEvents_ + refusedEvents_ > 0) {
    // With few exceptions, a refused event is older than all that still wait.
    const std::int64_t removed =
        refusedEvents_ > 0 ? removeOldest("refused", atOnce) : removeOldest("waiting", atOnce);
    if (removed == 0) return;
    drop(removed);
    recount();
  }
}

std::int64_t EventSpool::removeOldest(const char* table, std::int64_t count) {
  const bool isRemoved = run(fmt::format(
      "DELETE FROM {0} WHERE id IN (SELECT id FROM {0} ORDER BY id LIMIT {1})", table, count));
  return isRemoved ? database_->changedRows() : 0;
}

void EventSpool::drop(std::int64_t count) {
  unsavedDropped_ += count;
  if (!database_) return;
  if (run(fmt::format("UPDATE counter SET dropped = dropped + {}", unsavedDropped_)))
    unsavedDropped_ = 0;
}

bool EventSpool::removeEach(std::string_view table, std::span<const SpooledEvent> events) {
  // The row's number alone may belong to another event by now.
  auto removal = prepare(fmt::format("DELETE FROM {} WHERE id = ? AND uuid = ?", table));
  if (!removal) return false;
  std::int64_t& counter = table == "waiting" ? waitingEvents_ : refusedEvents_;
  for (const SpooledEvent& event : events) {
    removal->bind(1, event.id);
    removal->bind(2, event.uuid);
    if (!run(*removal)) return false;
    if (database_->changedRows() == 0) continue;
    --counter;
    bytes_ -= static_cast<std::int64_t>(event.hit.size());
  }
  return true;
}

std::optional<EventSpool::Statement> EventSpool::prepare(std::string_view sql) {
  if (!database_) return std::nullopt;
  auto statement = database_->prepare(sql);
  if (statement) return std::move(statement).value();
  failed(statement.error());
  return std::nullopt;
}

std::optional<std::int64_t> EventSpool::number(std::string_view sql) {
  auto statement = prepare(sql);
  if (!statement) return std::nullopt;
  const auto step = statement->step();
  if (!step || *step == Step::done) return std::nullopt;
  return statement->integer(0);
}

bool EventSpool::run(Statement& statement) {
  const auto step = statement.step();
  statement.reset();
  if (step) return true;
  failed(step.error());
  return false;
}

bool EventSpool::run(const std::string& sql) {
  if (!database_) return false;
  const auto error = database_->execute(sql);
  if (!error) return true;
  failed(*error);
  return false;
}

void EventSpool::failed(const PlatformError& error) {
  // An open transaction would make every later one fail as well.
  if (database_) static_cast<void>(database_->execute("ROLLBACK"));
  if (std::exchange(hasReported_, true)) return;
  ports_.systemLog.write("Events may be lost: " + path_ + ": " + error.localizedDescription());
}

}  // namespace Tallyhouse
