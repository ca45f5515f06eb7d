// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Generic/NotificationStore.h>

#include <algorithm>
#include <string_view>
#include <tuple>

#include <Varnel/Platform/Generic/NotificationRows.h>
#include <Varnel/Platform/Text/Calendar.h>
#include <Varnel/Platform/Values/Restorer.h>
#include <Varnel/Platform/Values/UUID.h>

namespace Varnel::Platform {
namespace {

using Failure = NotificationStore::Failure;
using enum DeliveryState;

// The delivered list keeps the latest, because nobody has to remove any. What has yet to be shown
// stays.
constexpr std::int64_t maxDelivered = 100;

// A notification is known by its identifier. One without an identifier gets a unique name.
std::string keyOf(const UserNotification& notification) {
  return notification.identifier ? "identifier " + *notification.identifier
                                 : "unique " + randomUUIDString();
}

// Runs a statement, and forgets what is removed and has no banner any more.
template <typename... Parameters>
Failure update(SQLiteDatabase& database, std::string_view sql, const Parameters&... parameters) {
  if (auto error = database.run(sql, parameters...)) return error;
  return database.run("DELETE FROM deliveries WHERE state = 'removed' AND banner IS NULL");
}

// Whatever the clock was when they were delivered, they came before what is delivered now.
Failure endFuture(SQLiteDatabase& database, Date now) {
  return database.run(
      "UPDATE deliveries SET delivered = ? - rank FROM (SELECT number AS future,"
      " row_number() OVER (ORDER BY delivered DESC, date DESC) AS rank FROM deliveries"
      " WHERE delivered > ?) WHERE number = future",
      now, now);
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
  return error ? error : insertDelivery(database, delivery);
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
    if (auto error = insertDelivery(database, next)) return error;
  }
  if (!decision.isDue) return std::nullopt;
  Delivery claimed = delivery;
  claimed.schedule.notification.deliveryDate = nextDate(delivery.schedule, calendar);
  return insertDue(database, std::move(claimed), now);
}

}  // namespace

NotificationStore::NotificationStore(DurableFile::Ports ports, const std::string& file,
                                     Migrating migrating)
    : file_(ports, file, notificationFormat(), migrating) {}

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
  if (auto error =
          read([&](SQLiteDatabase& database) { return selectDeliveries(database, states, found); }))
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
    return error ? error : insertDelivery(database, delivery);
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
    if (auto error = selectDeliveries(database, {planned}, present)) return error;
    // A clock that is wrong for a moment, so that nothing is due, leaves the dates alone.
    if (std::any_of(present.begin(), present.end(), [&](const Delivery& each) {
          return decide(each.schedule, now, calendar).isDue;
        }))
      if (auto error = endFuture(database, now)) return error;
    for (const Delivery& each : present)
      if (changes(each.schedule, now, calendar))
        if (auto error = claim(database, each, now, calendar)) return error;
    return std::nullopt;
  });
}

Failure NotificationStore::makeDue(const UserNotification& notification, Date now) {
  const Delivery delivery{
      .schedule = {.key = keyOf(notification), .notification = notification, .timeZone = ""}};
  return write([&](SQLiteDatabase& database) {
    auto error = endFuture(database, now);
    return error ? error : insertDue(database, delivery, now);
  });
}

Result<std::vector<Delivery>> NotificationStore::decideDue(
    const std::map<std::int64_t, bool>& decisions) {
  std::vector<Delivery> decided;
  const auto error = write([&](SQLiteDatabase& database) -> Failure {
    if (auto failure = selectDeliveries(database, {due}, decided)) return failure;
    std::erase_if(decided, [&](const Delivery& each) { return !decisions.contains(each.number); });
    std::reverse(decided.begin(), decided.end());
    for (Delivery& each : decided) {
      each.state = decisions.at(each.number) ? toShow : hidden;
      if (auto failure = database.run("UPDATE deliveries SET state = ? WHERE number = ?",
                                      nameOf(each.state), each.number))
        return failure;
    }
    return update(database,
                  "UPDATE deliveries SET state = 'removed' WHERE number IN (SELECT number"
                  " FROM deliveries WHERE state IN ('hidden', 'shown', 'expired')"
                  " ORDER BY delivered DESC, date DESC LIMIT -1 OFFSET ?)",
                  maxDelivered);
  });
  if (error) return *error;
  return decided;
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

Failure NotificationStore::noteAllExpired() {
  const auto known = deliveries({shown});
  if (!known) return known.error();
  if (known->empty()) return std::nullopt;
  return write([](SQLiteDatabase& database) {
    return database.run("UPDATE deliveries SET state = 'expired' WHERE state = 'shown'");
  });
}

Failure NotificationStore::remove(std::int64_t number) {
  return write([&](SQLiteDatabase& database) {
    return update(database, "UPDATE deliveries SET state = 'removed' WHERE number = ?", number);
  });
}

Failure NotificationStore::keepSource(const NotificationSource& source) {
  return write([&](SQLiteDatabase& database) { return replaceSource(database, source); });
}

Result<std::optional<NotificationSource>> NotificationStore::source() {
  std::optional<NotificationSource> found;
  if (auto error = read([&](SQLiteDatabase& database) { return selectSource(database, found); }))
    return *error;
  return found;
}

Failure NotificationStore::keepLaunch(const UserNotification& notification, Date now) {
  // An application may never take one.
  return write([&](SQLiteDatabase& database) {
    auto error = database.run("DELETE FROM launches WHERE clicked <= ? OR clicked >= ?",
                              now - maxLaunchAge, now + maxLaunchAge);
    return error ? error : insertLaunch(database, {notification, now});
  });
}

Result<std::optional<UserNotification>> NotificationStore::takeLaunch(Date now) {
  std::vector<Launch> launches;
  const DurableFile::Work look = [&](SQLiteDatabase& database) {
    return selectLaunches(database, launches);
  };
  // A host looks at each start, and there is seldom one.
  if (auto error = read(look)) return *error;
  std::optional<UserNotification> taken;
  if (launches.empty()) return taken;
  const auto error = write([&](SQLiteDatabase& database) -> Failure {
    taken.reset();
    if (auto failure = look(database)) return failure;
    for (const Launch& each : launches) {
      if (taken) break;
      if (auto failure = database.run("DELETE FROM launches WHERE number = ?", each.number))
        return failure;
      // A clock that was set back may have made it one of the future.
      if (each.clicked > now - maxLaunchAge && each.clicked < now + maxLaunchAge)
        taken = each.notification;
    }
    return std::nullopt;
  });
  if (error) return *error;
  return taken;
}

}  // namespace Varnel::Platform
