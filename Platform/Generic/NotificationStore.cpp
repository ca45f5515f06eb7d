// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Generic/NotificationStore.h>

#include <fmt/format.h>

#include <algorithm>
#include <utility>

#include <Varnel/Platform/Generic/NotificationColumns.h>
#include <Varnel/Platform/Text/Calendar.h>
#include <Varnel/Platform/Values/UUID.h>

namespace Varnel::Platform {
namespace {

using Failure = std::optional<PlatformError>;

// The delivered list keeps the latest notifications, because nobody has to remove any.
constexpr int maxDelivered = 100;

std::string schema() {
  constexpr const char* content =
      "key TEXT PRIMARY KEY NOT NULL, identifier TEXT, title TEXT, text TEXT, action TEXT, "
      "other TEXT, date INTEGER, years INTEGER, months INTEGER, days INTEGER, hours INTEGER, "
      "minutes INTEGER, seconds INTEGER";
  return fmt::format(
      "CREATE TABLE IF NOT EXISTS scheduled ({0}, zone TEXT NOT NULL, count INTEGER NOT NULL);"
      "CREATE TABLE IF NOT EXISTS delivered ({0}, delivered INTEGER NOT NULL, banner TEXT);"
      "SELECT key, {1}, zone, count FROM scheduled LIMIT 0;"
      "SELECT key, {1}, delivered, banner FROM delivered LIMIT 0;",
      content, notificationColumns);
}

// A notification is known by its identifier. One without an identifier gets a unique name.
std::string keyOf(const UserNotification& notification) {
  return notification.identifier ? "identifier " + *notification.identifier
                                 : "unique " + randomUUIDString();
}

std::string textOf(SQLiteStatement& row, int column) {
  return std::string(row.text(column).value_or(std::string_view()));
}

// Runs a statement, handing each row to `use`.
template <typename Bind, typename Use>
Failure run(SQLiteDatabase& database, const std::string& sql, Bind bind, Use use) {
  auto statement = database.prepare(sql);
  if (!statement) return statement.error();
  bind(*statement);
  while (true) {
    const auto step = statement->step();
    if (!step) return step.error();
    if (*step == SQLiteStatement::Step::done) return std::nullopt;
    use(*statement);
  }
}

template <typename Bind>
Failure run(SQLiteDatabase& database, const std::string& sql, Bind bind) {
  return run(database, sql, bind, [](SQLiteStatement&) {});
}

constexpr auto nothingToBind = [](SQLiteStatement&) {};

Failure readSchedules(SQLiteDatabase& database, std::vector<NotificationSchedule>& schedules) {
  schedules.clear();
  return run(database,
             fmt::format("SELECT key, zone, count, {} FROM scheduled", notificationColumns),
             nothingToBind, [&](SQLiteStatement& row) {
               schedules.push_back({.key = textOf(row, 0),
                                    .notification = readNotification(row, 3),
                                    .timeZone = textOf(row, 1),
                                    .deliveryCount = row.integer(2).value_or(0)});
             });
}

Failure removeByKey(SQLiteDatabase& database, const std::string& table, const std::string& key) {
  return run(database, fmt::format("DELETE FROM {} WHERE key = ?", table),
             [&](SQLiteStatement& statement) { statement.bind(1, key); });
}

Failure advance(SQLiteDatabase& database, const std::string& key,
                const std::optional<std::int64_t>& count) {
  if (!count) return removeByKey(database, "scheduled", key);
  return run(database, "UPDATE scheduled SET count = ? WHERE key = ?",
             [&](SQLiteStatement& statement) {
               statement.bind(1, *count);
               statement.bind(2, key);
             });
}

Failure insertDelivered(SQLiteDatabase& database, DeliveredNotification& delivered, Date now) {
  const std::int64_t time = now.time_since_epoch().count();
  delivered.notification.actualDeliveryDate = now;
  auto failure = run(
      database, "SELECT banner FROM delivered WHERE key = ?",
      [&](SQLiteStatement& statement) { statement.bind(1, delivered.key); },
      [&](SQLiteStatement& row) {
        if (const auto banner = row.text(0)) delivered.bannerReference = std::string(*banner);
      });
  if (failure) return failure;
  failure = run(database,
                fmt::format("INSERT OR REPLACE INTO delivered (key, delivered, {}) VALUES "
                            "(?, ?, ?, ?, ?, ?, ?, ?, ?, ?, ?, ?, ?, ?)",
                            notificationColumns),
                [&](SQLiteStatement& statement) {
                  statement.bind(1, delivered.key);
                  statement.bind(2, time);
                  bindNotification(statement, 3, delivered.notification);
                });
  if (failure) return failure;
  return run(database,
             "DELETE FROM delivered WHERE key NOT IN "
             "(SELECT key FROM delivered ORDER BY delivered DESC, rowid DESC LIMIT ?)",
             [](SQLiteStatement& statement) { statement.bind(1, std::int64_t{maxDelivered}); });
}

bool anythingChanges(const NotificationSchedule& schedule, Date now, const Calendar& calendar) {
  return decide(schedule, now, calendar) !=
         ScheduleDecision{.isDue = false, .deliveryCount = schedule.deliveryCount};
}

}  // namespace

NotificationStore::NotificationStore(std::filesystem::path file, SystemLog& systemLog)
    : file_(std::move(file), schema(), systemLog) {}

void NotificationStore::schedule(const UserNotification& notification, Date now,
                                 const Calendar& calendar) {
  UserNotification content = notification;
  if (!content.deliveryDate) content.deliveryDate = now;
  const std::string key = keyOf(notification);
  file_.change([&](SQLiteDatabase& database) {
    return run(database,
               fmt::format("INSERT OR REPLACE INTO scheduled (key, zone, count, {}) VALUES "
                           "(?, ?, 0, ?, ?, ?, ?, ?, ?, ?, ?, ?, ?, ?, ?)",
                           notificationColumns),
               [&](SQLiteStatement& statement) {
                 statement.bind(1, key);
                 statement.bind(2, calendar.timeZoneIdentifier());
                 bindNotification(statement, 3, content);
               });
  });
}

std::vector<NotificationSchedule> NotificationStore::schedules() {
  std::vector<NotificationSchedule> schedules;
  isOutOfOrder_ =
      !file_.read([&](SQLiteDatabase& database) { return readSchedules(database, schedules); });
  return schedules;
}

void NotificationStore::removeSchedule(const std::string& key) {
  file_.change([&](SQLiteDatabase& database) { return removeByKey(database, "scheduled", key); });
}

std::vector<DeliveredNotification> NotificationStore::claimDue(Date now, const Calendar& calendar) {
  std::vector<DeliveredNotification> claimed;
  // Processes that watch the file are not woken for nothing.
  const auto known = schedules();
  if (std::none_of(known.begin(), known.end(), [&](const NotificationSchedule& schedule) {
        return anythingChanges(schedule, now, calendar);
      }))
    return claimed;

  const auto claim = [&](SQLiteDatabase& database) -> Failure {
    claimed.clear();
    std::vector<NotificationSchedule> present;
    if (auto failure = readSchedules(database, present)) return failure;
    std::stable_sort(present.begin(), present.end(), [&](const auto& left, const auto& right) {
      return nextDate(left, calendar) < nextDate(right, calendar);
    });
    for (const NotificationSchedule& schedule : present) {
      const ScheduleDecision decision = decide(schedule, now, calendar);
      if (decision.deliveryCount != schedule.deliveryCount)
        if (auto failure = advance(database, schedule.key, decision.deliveryCount)) return failure;
      if (!decision.isDue) continue;
      DeliveredNotification delivered{.key = schedule.key, .notification = schedule.notification};
      delivered.notification.deliveryDate = nextDate(schedule, calendar);
      if (auto failure = insertDelivered(database, delivered, now)) return failure;
      claimed.push_back(std::move(delivered));
    }
    return std::nullopt;
  };
  if (!file_.change(claim)) claimed.clear();
  return claimed;
}

DeliveredNotification NotificationStore::addDelivered(const UserNotification& notification,
                                                      Date now) {
  DeliveredNotification delivered{.key = keyOf(notification), .notification = notification};
  file_.change([&](SQLiteDatabase& database) { return insertDelivered(database, delivered, now); });
  return delivered;
}

std::vector<DeliveredNotification> NotificationStore::delivered() {
  std::vector<DeliveredNotification> all;
  file_.read([&](SQLiteDatabase& database) {
    all.clear();
    return run(database,
               fmt::format("SELECT key, delivered, banner, {} FROM delivered "
                           "ORDER BY delivered DESC, rowid DESC",
                           notificationColumns),
               nothingToBind, [&](SQLiteStatement& row) {
                 DeliveredNotification each{.key = textOf(row, 0),
                                            .notification = readNotification(row, 3)};
                 each.notification.actualDeliveryDate =
                     Date(Date::duration(row.integer(1).value_or(0)));
                 if (const auto banner = row.text(2)) each.bannerReference = std::string(*banner);
                 all.push_back(std::move(each));
               });
  });
  return all;
}

void NotificationStore::removeDelivered(const std::string& key) {
  file_.change([&](SQLiteDatabase& database) { return removeByKey(database, "delivered", key); });
}

void NotificationStore::setBannerReference(const std::string& key, const std::string& reference) {
  file_.change([&](SQLiteDatabase& database) {
    return run(database, "UPDATE delivered SET banner = ? WHERE key = ?",
               [&](SQLiteStatement& statement) {
                 statement.bind(1, reference);
                 statement.bind(2, key);
               });
  });
}

}  // namespace Varnel::Platform
