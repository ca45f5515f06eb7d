// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <optional>
#include <string_view>
#include <vector>

#include <Varnel/Platform/Generic/Delivery.h>
#include <Varnel/Platform/SQLite/DurableFormat.h>
#include <Varnel/Platform/Values/NotificationSource.h>

/// The rows of the store of notifications. All of this is for the store alone.
namespace Varnel::Platform {

class SQLiteDatabase;

[[nodiscard]] DurableFormat notificationFormat();

/// As it stands in the file.
[[nodiscard]] std::string_view nameOf(DeliveryState state);

/// A delivery without a number gets one.
[[nodiscard]] std::optional<PlatformError> insertDelivery(SQLiteDatabase& database,
                                                          const Delivery& delivery);
/// Finds those in these states, the latest first. Any content gives a notification; a state of
/// another version is passed over.
[[nodiscard]] std::optional<PlatformError> selectDeliveries(
    SQLiteDatabase& database, const std::vector<DeliveryState>& states,
    std::vector<Delivery>& found);

[[nodiscard]] std::optional<PlatformError> replaceSource(SQLiteDatabase& database,
                                                         const NotificationSource& source);
/// None also in a file of the first version, which knows of no products.
[[nodiscard]] std::optional<PlatformError> selectSource(SQLiteDatabase& database,
                                                        std::optional<NotificationSource>& found);

/// A click for which the application is being started. A plain value.
struct Launch final {
  UserNotification notification;
  Date clicked;
  std::int64_t number = 0;
};

[[nodiscard]] std::optional<PlatformError> insertLaunch(SQLiteDatabase& database, Launch launch);
/// The earliest first.
[[nodiscard]] std::optional<PlatformError> selectLaunches(SQLiteDatabase& database,
                                                          std::vector<Launch>& found);

}  // namespace Varnel::Platform
