// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Generic/NotificationColumns.h>

#include <array>
#include <string>

namespace Varnel::Platform {
namespace {

using Text = std::optional<std::string> UserNotification::*;
using Amount = std::optional<std::int64_t> DateComponents::*;

constexpr std::array<Text, 5> texts{
    &UserNotification::identifier, &UserNotification::title, &UserNotification::informativeText,
    &UserNotification::actionButtonTitle, &UserNotification::otherButtonTitle};

constexpr std::array<Amount, 6> amounts{&DateComponents::year,   &DateComponents::month,
                                        &DateComponents::day,    &DateComponents::hour,
                                        &DateComponents::minute, &DateComponents::second};

static_assert(texts.size() + 1 + amounts.size() == notificationColumnCount);

template <typename Value>
void bindOptional(SQLiteStatement& statement, int index, const std::optional<Value>& value) {
  if (value)
    statement.bind(index, *value);
  else
    statement.bindNull(index);
}

}  // namespace

void bindNotification(SQLiteStatement& statement, int first, const UserNotification& notification) {
  int index = first;
  for (const Text text : texts) bindOptional(statement, index++, notification.*text);
  const auto& date = notification.deliveryDate;
  bindOptional(statement, index++,
               date ? std::optional<std::int64_t>(date->time_since_epoch().count()) : std::nullopt);
  const DateComponents interval = notification.deliveryRepeatInterval.value_or(DateComponents());
  for (const Amount amount : amounts) bindOptional(statement, index++, interval.*amount);
}

UserNotification readNotification(SQLiteStatement& row, int first) {
  UserNotification notification;
  int index = first;
  for (const Text text : texts)
    if (const auto value = row.text(index++)) notification.*text = std::string(*value);
  if (const auto date = row.integer(index++))
    notification.deliveryDate = Date(Date::duration(*date));
  DateComponents interval;
  for (const Amount amount : amounts) interval.*amount = row.integer(index++);
  if (interval != DateComponents()) notification.deliveryRepeatInterval = interval;
  return notification;
}

}  // namespace Varnel::Platform
