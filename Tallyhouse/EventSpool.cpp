// SPDX-License-Identifier: MIT
#include <Varnel/Tallyhouse/EventSpool.h>

#include <limits>

#include <Varnel/Tallyhouse/EventRecorder.h>

namespace Tallyhouse {

using Varnel::Platform::Date;
using Varnel::Platform::SQLiteDatabase;
using Varnel::Platform::SQLiteStatement;
using Error = std::optional<Varnel::Platform::PlatformError>;

namespace {

std::optional<Date> dateOf(std::optional<std::int64_t> number) {
  if (!number) return std::nullopt;
  return Date(Date::duration(*number));
}

// Work that is done again must find what it did before: so the count of refusals is set, not
// raised.
Error settle(SQLiteDatabase& database, const SpooledEvent& event, const DeliveryOutcome& outcome) {
  if (outcome.verdict == Verdict::delivered)
    return run(database, "DELETE FROM event WHERE id = ? AND uuid = ?", event.id, event.uuid);
  if (outcome.verdict == Verdict::refused)
    return run(database, "UPDATE event SET refusals = ?, refused_at = ? WHERE id = ? AND uuid = ?",
               std::int64_t{event.refusals + 1}, outcome.date.time_since_epoch().count(), event.id,
               event.uuid);
  return std::nullopt;
}

}  // namespace

EventSpool::EventSpool(Ports ports, std::string path)
    : ports_(ports),
      path_(std::move(path)),
      file_(ports, path_, spoolFormat(), Varnel::Platform::Migrating::allowed) {}

std::unique_ptr<Varnel::Platform::FileLock> EventSpool::elect() {
  return ports_.privateFiles.tryLock(path_ + ".deliverer").valueOr(nullptr);
}

std::optional<SpoolOutlook> EventSpool::look(const std::string& server, std::size_t maxEvents,
                                             int maxRefusals) {
  SpoolOutlook outlook;
  const auto error = file_.read([&](SQLiteDatabase& database) {
    outlook = {.backlog = {}, .state = {.server = server, .notBefore = {}}};
    auto failure = query(
        database,
        "SELECT count(*), min(date) FROM"
        " (SELECT date FROM event WHERE refusals = 0 ORDER BY id LIMIT ?)",
        [&](SQLiteStatement& row) {
          outlook.backlog.waiting = row.integer(0).value_or(0);
          outlook.backlog.oldest = dateOf(row.integer(1));
          return false;
        },
        static_cast<std::int64_t>(maxEvents));
    if (failure) return failure;
    failure = query(
        database, "SELECT min(refused_at) FROM event WHERE refusals > 0 AND refusals < ?",
        [&](SQLiteStatement& row) {
          outlook.backlog.refused = dateOf(row.integer(0));
          return false;
        },
        std::int64_t{maxRefusals});
    if (failure) return failure;
    return query(
        database, "SELECT nullif(not_before, 0), failures FROM state WHERE server = ?",
        [&](SQLiteStatement& row) {
          outlook.state.notBefore = dateOf(row.integer(0));
          outlook.state.failures = static_cast<int>(row.integer(1).value_or(0));
          return false;
        },
        server);
  });
  return error ? std::nullopt : std::optional(outlook);
}

std::vector<SpooledEvent> EventSpool::waiting(std::size_t maxEvents, std::size_t maxBytes) {
  return events(
      "SELECT id, uuid, date, hit, refusals FROM event WHERE refusals = 0 ORDER BY id LIMIT ?",
      static_cast<std::int64_t>(maxEvents), maxBytes);
}

std::vector<SpooledEvent> EventSpool::refused(int maxRefusals) {
  return events(
      "SELECT id, uuid, date, hit, refusals FROM event WHERE refusals > 0 AND refusals < ?"
      " ORDER BY refused_at, id LIMIT 1",
      maxRefusals, std::numeric_limits<std::size_t>::max());
}

std::vector<SpooledEvent> EventSpool::events(const char* sql, std::int64_t parameter,
                                             std::size_t maxBytes) {
  std::vector<SpooledEvent> found;
  const auto error = file_.read([&](SQLiteDatabase& database) {
    found.clear();
    std::size_t size = 0;
    return query(
        database, sql,
        [&](SQLiteStatement& row) {
          const auto hit = row.text(3).value_or("");
          size += hit.size();
          if (size > maxBytes && !found.empty()) return false;
          found.push_back({.id = row.integer(0).value_or(0),
                           .uuid = std::string(row.text(1).value_or("")),
                           .date = dateOf(row.integer(2)).value_or(Date()),
                           .hit = std::string(hit),
                           .refusals = static_cast<int>(row.integer(4).value_or(0))});
          return true;
        },
        parameter);
  });
  if (error) found.clear();
  return found;
}

bool EventSpool::save(const DeliveryOutcome& outcome) {
  const auto error = file_.change([&](SQLiteDatabase& database) -> Error {
    for (const SpooledEvent& event : outcome.events)
      if (auto failure = settle(database, event, outcome)) return failure;
    return run(database,
               "INSERT INTO state(id, server, not_before, failures) VALUES(1, ?1, ?2, ?3)"
               " ON CONFLICT(id) DO UPDATE SET server = ?1, not_before = ?2, failures = ?3",
               outcome.state.server,
               outcome.state.notBefore.value_or(Date()).time_since_epoch().count(),
               std::int64_t{outcome.state.failures});
  });
  return !error;
}

bool EventSpool::isDelivered(const OwnEvents& events) {
  if (events.isHeld || events.hasLost) return false;
  if (events.first == 0) return true;
  bool isDelivered = false;
  // Those that are gone may also have been pushed out, or have been discarded by another process.
  const auto error = file_.read([&](SQLiteDatabase& database) {
    isDelivered = false;
    return query(
        database,
        "SELECT NOT EXISTS (SELECT 1 FROM event WHERE id BETWEEN ?1 AND ?2)"
        " AND NOT EXISTS (SELECT 1 FROM state WHERE lost_through >= ?1 OR epoch > ?3)",
        [&](SQLiteStatement& row) {
          isDelivered = row.integer(0) == 1;
          return false;
        },
        events.first, events.last, events.epoch);
  });
  return !error && isDelivered;
}

}  // namespace Tallyhouse
