// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Generic/NotificationStore.h>

#include <algorithm>
#include <array>
#include <string_view>
#include <tuple>

#include <Varnel/Platform/Text/Calendar.h>
#include <Varnel/Platform/Values/Restorer.h>
#include <Varnel/Platform/Values/UUID.h>
#include <fmt/format.h>

namespace Varnel::Platform {
namespace {

using Failure = NotificationStore::Failure;
using enum DeliveryState;

// As they stand in the file, in the order of the enumeration.
constexpr std::array<const char*, 7> stateNames{"planned", "due",     "hidden", "toShow",
                                                "shown",   "expired", "removed"};

// The delivered list keeps the latest, because nobody has to remove any. What has yet to be shown
// stays.
constexpr std::int64_t maxDelivered = 100;

DurableFormat format() {
  // Numbers are random, so that rows which were saved from a lost file meet no others.
  constexpr const char* schema =
      "CREATE TABLE deliveries (number INTEGER PRIMARY KEY, state TEXT NOT NULL, key TEXT NOT NULL,"
      " zone TEXT NOT NULL, count INTEGER NOT NULL, banner TEXT, delivered INTEGER,"
      " identifier TEXT, title TEXT, text TEXT, action TEXT, other TEXT, date INTEGER,"
      " years INTEGER, months INTEGER, days INTEGER, hours INTEGER, minutes INTEGER,"
      " seconds INTEGER);"
      "CREATE UNIQUE INDEX planned ON deliveries (key) WHERE state = 'planned';"
      "CREATE UNIQUE INDEX delivered ON deliveries (key)"
      " WHERE state IN ('due', 'hidden', 'toShow', 'shown', 'expired')";
  return {.subject = "notifications",
          .applicationID = 0x564e6f74,
          .version = {.major = 1, .minor = 0},
          .schema = schema,
          .migrations = {},
          .journal = DurableFormat::Journal::rollback,
          .synchronisation = DurableFormat::Synchronisation::survivesPowerLoss,
          .tables = {{.name = "deliveries"}}};
}

constexpr const char* columns =
    "number, state, key, zone, count, banner, delivered, identifier, title, text, action, other,"
    " date, years, months, days, hours, minutes, seconds";

/// A delivery as it stands in the table.
struct Row {
  Delivery delivery;
  std::string state;
  DateComponents interval;  ///< Empty where the notification does not repeat.

  /// In the order of the columns.
  auto values() {
    auto& [key, content, zone, count] = delivery.schedule;
    return std::tie(delivery.number, state, key, zone, count, delivery.banner,
                    content.actualDeliveryDate, content.identifier, content.title,
                    content.informativeText, content.actionButtonTitle, content.otherButtonTitle,
                    content.deliveryDate, interval.year, interval.month, interval.day,
                    interval.hour, interval.minute, interval.second);
  }
};

// A notification is known by its identifier. One without an identifier gets a unique name.
std::string keyOf(const UserNotification& notification) {
  return notification.identifier ? "identifier " + *notification.identifier
                                 : "unique " + randomUUIDString();
}

Failure insert(SQLiteDatabase& database, const Delivery& delivery) {
  static const std::string sql = fmt::format(
      "INSERT INTO deliveries ({}) VALUES (coalesce(nullif(?, 0), random()), "
      "?, ?, ?, ?, ?, ?, ?, ?, ?, ?, ?, ?, ?, ?, ?, ?, ?, ?)",
      columns);
  const auto& interval = delivery.schedule.notification.deliveryRepeatInterval;
  Row row{.delivery = delivery,
          .state = stateNames.at(static_cast<std::size_t>(delivery.state)),
          .interval = interval.value_or(DateComponents())};
  return std::apply([&](const auto&... values) { return database.run(sql, values...); },
                    row.values());
}

// Any content gives a notification. A state of another version is passed over.
Failure select(SQLiteDatabase& database, const std::vector<DeliveryState>& states,
               std::vector<Delivery>& found) {
  static const std::string sql =
      fmt::format("SELECT {} FROM deliveries ORDER BY delivered DESC, date DESC", columns);
  found.clear();
  return database.each(sql, [&](SQLiteStatement& statement) {
    Row row;
    statement.read(row.values());
    const auto name = std::find(stateNames.begin(), stateNames.end(), row.state);
    row.delivery.state = static_cast<DeliveryState>(name - stateNames.begin());
    if (std::find(states.begin(), states.end(), row.delivery.state) == states.end()) return;
    if (row.interval != DateComponents())
      row.delivery.schedule.notification.deliveryRepeatInterval = row.interval;
    found.push_back(std::move(row.delivery));
  });
}

// Runs a statement, and forgets what is removed and has no banner any more.
template <typename... Parameters>
Failure update(SQLiteDatabase& database, std::string_view sql, const Parameters&... parameters) {
  if (auto error = database.run(sql, parameters...)) return error;
  return database.run("DELETE FROM deliveries WHERE state = 'removed' AND banner IS NULL");
}

// In the place of the last delivery with this key, and of its banner.
Failure insertDue(SQLiteDatabase& database, Delivery delivery, Date now) {
  delivery.state = due;
  delivery.schedule.notification.actualDeliveryDate = now;
  const std::string predecessor =
      "FROM deliveries WHERE key = ? AND state NOT IN ('planned', 'removed')";
  const std::string& key = delivery.schedule.key;
  auto error = database.row("SELECT banner " + predecessor, std::tie(delivery.banner), key);
  if (!error) error = database.run("DELETE " + predecessor, key);
  return error ? error : insert(database, delivery);
}

bool changes(const NotificationSchedule& schedule, Date now, const Calendar& calendar) {
  return decide(schedule, now, calendar) !=
         ScheduleDecision{.isDue = false, .deliveryCount = schedule.deliveryCount};
}

// The delivery itself becomes due; the next one of its schedule is another.
Failure claim(SQLiteDatabase& database, const Delivery& delivery, Date now,
              const Calendar& calendar) {
  const ScheduleDecision decision = decide(delivery.schedule, now, calendar);
  if (auto error = database.run("DELETE FROM deliveries WHERE number = ?", delivery.number))
    return error;
  if (decision.deliveryCount) {
    Delivery next{.schedule = delivery.schedule};
    next.schedule.deliveryCount = *decision.deliveryCount;
    if (auto error = insert(database, next)) return error;
  }
  if (!decision.isDue) return std::nullopt;
  Delivery claimed = delivery;
  claimed.schedule.notification.deliveryDate = nextDate(delivery.schedule, calendar);
  return insertDue(database, std::move(claimed), now);
}

}  // namespace

NotificationStore::NotificationStore(DurableFile::Ports ports, const std::string& file)
    : file_(ports, file, format(), Migrating::allowed) {}

Failure NotificationStore::read(const DurableFile::Work& work) {
  return open_ ? work(*open_) : file_.read(work);
}

Failure NotificationStore::write(const DurableFile::Work& work) {
  return open_ ? work(*open_) : file_.change(work);
}

Failure NotificationStore::change(const std::function<Failure()>& calls) {
  if (open_) return calls();
  return file_.change([&](SQLiteDatabase& database) {
    const Restorer before(open_);
    open_ = &database;
    return calls();
  });
}

Result<std::vector<Delivery>> NotificationStore::deliveries(
    const std::vector<DeliveryState>& states) {
  std::vector<Delivery> found;
  if (auto error = read([&](SQLiteDatabase& database) { return select(database, states, found); }))
    return *error;
  return found;
}

Failure NotificationStore::plan(const UserNotification& notification, Date now,
                                const Calendar& calendar) {
  Delivery delivery{.schedule = {.key = keyOf(notification),
                                 .notification = notification,
                                 .timeZone = calendar.timeZoneIdentifier()}};
  if (!notification.deliveryDate) delivery.schedule.notification.deliveryDate = now;
  return write([&](SQLiteDatabase& database) {
    auto error = database.run("DELETE FROM deliveries WHERE key = ? AND state = 'planned'",
                              delivery.schedule.key);
    return error ? error : insert(database, delivery);
  });
}

Failure NotificationStore::claimDue(Date now, const Calendar& calendar) {
  // Processes that watch the file are not woken for nothing.
  const auto known = deliveries({planned});
  if (!known) return known.error();
  if (std::none_of(known->begin(), known->end(),
                   [&](const Delivery& each) { return changes(each.schedule, now, calendar); }))
    return std::nullopt;
  return write([&](SQLiteDatabase& database) -> Failure {
    std::vector<Delivery> present;
    if (auto error = select(database, {planned}, present)) return error;
    for (const Delivery& each : present)
      if (changes(each.schedule, now, calendar))
        if (auto error = claim(database, each, now, calendar)) return error;
    return std::nullopt;
  });
}

Failure NotificationStore::makeDue(const UserNotification& notification, Date now) {
  const Delivery delivery{
      .schedule = {.key = keyOf(notification), .notification = notification, .timeZone = ""}};
  return write([&](SQLiteDatabase& database) { return insertDue(database, delivery, now); });
}

Failure NotificationStore::decideDue(const std::vector<std::pair<std::int64_t, bool>>& isToShow) {
  return write([&](SQLiteDatabase& database) -> Failure {
    for (const auto& [number, shows] : isToShow)
      if (auto error =
              database.run("UPDATE deliveries SET state = ? WHERE number = ? AND state = 'due'",
                           std::string_view(shows ? "toShow" : "hidden"), number))
        return error;
    return update(database,
                  "UPDATE deliveries SET state = 'removed' WHERE number IN (SELECT number"
                  " FROM deliveries WHERE state IN ('hidden', 'shown', 'expired')"
                  " ORDER BY delivered DESC, date DESC LIMIT -1 OFFSET ?)",
                  maxDelivered);
  });
}

Result<bool> NotificationStore::noteShown(std::int64_t number, const std::string& banner) {
  bool isThere = false;
  if (auto error = write([&](SQLiteDatabase& database) {
        auto failure = database.run(
            "UPDATE deliveries SET state = 'shown', banner = ? "
            "WHERE number = ? AND state IN ('toShow', 'shown')",
            banner, number);
        isThere = database.changedRows() > 0;
        return failure;
      }))
    return *error;
  return isThere;
}

Failure NotificationStore::noteGone(std::int64_t number) {
  return write([&](SQLiteDatabase& database) {
    return update(database,
                  "UPDATE deliveries SET banner = NULL,"
                  " state = CASE state WHEN 'shown' THEN 'expired' ELSE state END WHERE number = ?",
                  number);
  });
}

Failure NotificationStore::remove(std::int64_t number) {
  return write([&](SQLiteDatabase& database) {
    return update(database, "UPDATE deliveries SET state = 'removed' WHERE number = ?", number);
  });
}

}  // namespace Varnel::Platform
