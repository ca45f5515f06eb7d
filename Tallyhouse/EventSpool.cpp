// SPDX-License-Identifier: MIT
#include <Varnel/Tallyhouse/EventSpool.h>

#include <limits>
#include <tuple>
#include <utility>

#include <Varnel/Platform/Ports/SystemLog.h>
#include <fmt/format.h>

namespace Tallyhouse {

namespace {

// Work that is done again must find what it did before: so the count of refusals is set, not
// raised.
Failure settle(SQLiteDatabase& database, const SpooledEvent& event,
               const DeliveryOutcome& outcome) {
  if (outcome.verdict == Verdict::delivered)
    return database.run("DELETE FROM event WHERE id = ? AND uuid = ?", event.id, event.uuid);
  if (outcome.verdict == Verdict::refused)
    return database.run("UPDATE event SET refusals = ?, refused_at = ? WHERE id = ? AND uuid = ?",
                        event.refusals + 1, outcome.date, event.id, event.uuid);
  return std::nullopt;
}

}  // namespace

EventSpool::EventSpool(Ports ports, std::string path)
    : ports_(ports),
      path_(std::move(path)),
      file_(ports, path_, spoolFormat(), Varnel::Platform::Migrating::allowed) {}

Varnel::Platform::Result<std::unique_ptr<Varnel::Platform::FileLock>> EventSpool::elect() {
  auto lock = ports_.privateFiles.tryLock(path_ + ".deliverer");
  if (!lock && !std::exchange(hasSaid_, true))
    ports_.systemLog.write(
        fmt::format("Events cannot be delivered: {}", lock.error().localizedDescription()));
  return lock;
}

std::optional<SpoolOutlook> EventSpool::look(const std::string& server, std::size_t maxEvents,
                                             int maxRefusals) {
  SpoolOutlook outlook;
  const auto error = file_.read([&](SQLiteDatabase& database) {
    outlook = {.backlog = {}, .state = {.server = server, .notBefore = {}}};
    auto& [waiting, oldest, refused] = outlook.backlog;
    auto failure = database.row(
        "SELECT count(*), min(date),"
        " (SELECT min(refused_at) FROM event WHERE refusals > 0 AND refusals < ?)"
        " FROM (SELECT date FROM event WHERE refusals = 0 ORDER BY id LIMIT ?)",
        std::tie(waiting, oldest, refused), maxRefusals, static_cast<std::int64_t>(maxEvents));
    if (failure) return failure;
    return database.row(
        "SELECT nullif(not_before, 0), obstacle, failures FROM state WHERE server = ?",
        std::tie(outlook.state.notBefore, outlook.state.obstacle, outlook.state.failures), server);
  });
  return error ? std::nullopt : std::optional(outlook);
}

std::vector<SpooledEvent> EventSpool::waiting(std::size_t maxEvents, std::size_t maxBytes) {
  return events("refusals = 0 ORDER BY id LIMIT ?", static_cast<std::int64_t>(maxEvents), maxBytes);
}

std::vector<SpooledEvent> EventSpool::refused(int maxRefusals) {
  return events("refusals > 0 AND refusals < ? ORDER BY refused_at, id LIMIT 1", maxRefusals,
                std::numeric_limits<std::size_t>::max());
}

std::vector<SpooledEvent> EventSpool::events(std::string_view which, std::int64_t parameter,
                                             std::size_t maxBytes) {
  std::vector<SpooledEvent> found;
  const auto error = file_.read([&](SQLiteDatabase& database) {
    found.clear();
    std::size_t size = 0;
    return database.each(
        fmt::format("SELECT id, uuid, date, hit, refusals FROM event WHERE {}", which),
        [&](Varnel::Platform::SQLiteStatement& row) {
          SpooledEvent event;
          row.read(std::tie(event.id, event.uuid, event.date, event.hit, event.refusals));
          size += event.hit.size();
          if (size <= maxBytes || found.empty()) found.push_back(std::move(event));
        },
        parameter);
  });
  if (error) found.clear();
  return found;
}

bool EventSpool::save(const DeliveryOutcome& outcome) {
  return !file_.change([&](SQLiteDatabase& database) -> Failure {
    for (const SpooledEvent& event : outcome.events)
      if (auto failure = settle(database, event, outcome)) return failure;
    return database.run(
        "INSERT INTO state(id, server, not_before, obstacle, failures) VALUES(1, ?1, ?2, ?3, ?4)"
        " ON CONFLICT(id) DO UPDATE SET server = ?1, not_before = ?2, obstacle = ?3, failures = ?4",
        outcome.state.server, outcome.state.notBefore.value_or(Date()),
        static_cast<int>(outcome.state.obstacle), outcome.state.failures);
  });
}

}  // namespace Tallyhouse
