// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Generic/NotificationRows.h>

#include <algorithm>
#include <array>
#include <string>
#include <tuple>

#include <Varnel/Platform/SQLite/SQLiteDatabase.h>
#include <fmt/format.h>

namespace Varnel::Platform {
namespace {

using Failure = std::optional<PlatformError>;

// In the order of the enumeration.
constexpr std::array<std::string_view, 7> stateNames{"planned", "due",     "hidden", "toShow",
                                                     "shown",   "expired", "removed"};

// Numbers are random, so that rows which were saved from a lost file meet no others.
constexpr const char* deliveries =
    "CREATE TABLE deliveries (number INTEGER PRIMARY KEY, state TEXT NOT NULL, key TEXT NOT NULL,"
    " zone TEXT NOT NULL, count INTEGER NOT NULL, banner TEXT, delivered INTEGER,"
    " identifier TEXT, title TEXT, text TEXT, action TEXT, other TEXT, date INTEGER,"
    " years INTEGER, months INTEGER, days INTEGER, hours INTEGER, minutes INTEGER,"
    " seconds INTEGER);"
    "CREATE UNIQUE INDEX planned ON deliveries (key) WHERE state = 'planned';"
    "CREATE UNIQUE INDEX delivered ON deliveries (key)"
    " WHERE state IN ('due', 'hidden', 'toShow', 'shown', 'expired');";

// There is one product, with the number 1.
constexpr const char* productsAndLaunches =
    "CREATE TABLE products (number INTEGER PRIMARY KEY, identifier TEXT NOT NULL,"
    " name TEXT NOT NULL, desktop TEXT NOT NULL, icon TEXT NOT NULL);"
    "CREATE TABLE launches (number INTEGER PRIMARY KEY, clicked INTEGER NOT NULL, token TEXT,"
    " delivered INTEGER, identifier TEXT, title TEXT, text TEXT, action TEXT, other TEXT,"
    " date INTEGER, years INTEGER, months INTEGER, days INTEGER, hours INTEGER, minutes INTEGER,"
    " seconds INTEGER);";

constexpr const char* deliveryColumns = "number, state, key, zone, count, banner";
constexpr const char* launchColumns = "number, clicked, token";
constexpr const char* contentColumns =
    "delivered, identifier, title, text, action, other, date, years, months, days, hours, minutes,"
    " seconds";

/// A notification as it stands in a table.
struct Content {
  UserNotification& notification;
  DateComponents interval{};  ///< Empty where the notification does not repeat.

  explicit Content(UserNotification& content) : notification(content) {
    if (content.deliveryRepeatInterval) interval = *content.deliveryRepeatInterval;
  }

  /// In the order of the columns.
  auto values() {
    UserNotification& its = notification;
    return std::tie(its.actualDeliveryDate, its.identifier, its.title, its.informativeText,
                    its.actionButtonTitle, its.otherButtonTitle, its.deliveryDate, interval.year,
                    interval.month, interval.day, interval.hour, interval.minute, interval.second);
  }

  void read(SQLiteStatement& row, auto ownValues) {
    row.read(std::tuple_cat(ownValues, values()));
    if (interval != DateComponents()) notification.deliveryRepeatInterval = interval;
  }
};

auto valuesOf(Delivery& delivery, std::string& state) {
  auto& [key, notification, zone, count] = delivery.schedule;
  return std::tie(delivery.number, state, key, zone, count, delivery.banner);
}

auto valuesOf(Launch& launch) {
  return std::tie(launch.number, launch.clicked, launch.notification.activationToken);
}

// A row without a number gets one.
template <typename... Values>
Failure insert(SQLiteDatabase& database, std::string_view table, std::string_view ownColumns,
               std::tuple<Values&...> row) {
  std::string marks;
  for (std::size_t i = 1; i < sizeof...(Values); ++i) marks += ", ?";
  const std::string sql =
      fmt::format("INSERT INTO {} ({}, {}) VALUES (coalesce(nullif(?, 0), random()){})", table,
                  ownColumns, contentColumns, marks);
  return std::apply([&](const auto&... values) { return database.run(sql, values...); }, row);
}

}  // namespace

DurableFormat notificationFormat() {
  return {.subject = "notifications",
          .applicationID = 0x564e6f74,
          .version = {.major = 1, .minor = 1},
          .schema = std::string(deliveries) + productsAndLaunches,
          .migrations = {{.from = {.major = 1, .minor = 0}, .sql = productsAndLaunches}},
          .journal = DurableFormat::Journal::rollback,
          .synchronisation = DurableFormat::Synchronisation::survivesPowerLoss,
          .tables = {{.name = "deliveries"}, {.name = "products"}, {.name = "launches"}}};
}

std::string_view nameOf(DeliveryState state) {
  return stateNames.at(static_cast<std::size_t>(state));
}

Failure insertDelivery(SQLiteDatabase& database, const Delivery& delivery) {
  Delivery row = delivery;
  std::string state(nameOf(delivery.state));
  Content content(row.schedule.notification);
  return insert(database, "deliveries", deliveryColumns,
                std::tuple_cat(valuesOf(row, state), content.values()));
}

Failure selectDeliveries(SQLiteDatabase& database, const std::vector<DeliveryState>& states,
                         std::vector<Delivery>& found) {
  static const std::string sql =
      fmt::format("SELECT {}, {} FROM deliveries ORDER BY delivered DESC, date DESC",
                  deliveryColumns, contentColumns);
  found.clear();
  return database.each(sql, [&](SQLiteStatement& row) {
    Delivery delivery;
    std::string state;
    Content(delivery.schedule.notification).read(row, valuesOf(delivery, state));
    const auto name = std::find(stateNames.begin(), stateNames.end(), state);
    delivery.state = static_cast<DeliveryState>(name - stateNames.begin());
    if (std::find(states.begin(), states.end(), delivery.state) != states.end())
      found.push_back(std::move(delivery));
  });
}

Failure replaceSource(SQLiteDatabase& database, const NotificationSource& source) {
  return database.run(
      "INSERT OR REPLACE INTO products (number, identifier, name, desktop, icon)"
      " VALUES (1, ?, ?, ?, ?)",
      source.identifier, source.name, source.desktopEntry, source.icon);
}

Failure selectSource(SQLiteDatabase& database, std::optional<NotificationSource>& found) {
  found.reset();
  bool isKnown = false;
  auto error =
      database.row("SELECT 1 FROM sqlite_master WHERE name = 'products'", std::tie(isKnown));
  if (error || !isKnown) return error;
  return database.each("SELECT identifier, name, desktop, icon FROM products WHERE number = 1",
                       [&](SQLiteStatement& row) {
                         auto& [identifier, name, desktopEntry, icon] = found.emplace();
                         row.read(std::tie(identifier, name, desktopEntry, icon));
                       });
}

Failure insertLaunch(SQLiteDatabase& database, Launch launch) {
  Content content(launch.notification);
  return insert(database, "launches", launchColumns,
                std::tuple_cat(valuesOf(launch), content.values()));
}

Failure selectLaunches(SQLiteDatabase& database, std::vector<Launch>& found) {
  static const std::string sql =
      fmt::format("SELECT {}, {} FROM launches ORDER BY clicked", launchColumns, contentColumns);
  found.clear();
  return database.each(sql, [&](SQLiteStatement& row) {
    Launch& launch = found.emplace_back();
    Content(launch.notification).read(row, valuesOf(launch));
  });
}

}  // namespace Varnel::Platform
