// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Linux/Notifications/NotifierProtocol.h>

#include <cstdint>
#include <optional>

#include <Varnel/Platform/Values/UniqueHandle.h>

namespace Varnel::Platform::Linux {
namespace {

using Variant = UniqueHandle<GVariant*, g_variant_unref>;

// Every member of a notification, under its name on the bus.
template <typename Notification, typename Interval, typename Visit>
void visitMembers(Notification& notification, Interval& interval, Visit visit) {
  visit("identifier", notification.identifier);
  visit("title", notification.title);
  visit("text", notification.informativeText);
  visit("action", notification.actionButtonTitle);
  visit("other", notification.otherButtonTitle);
  visit("token", notification.activationToken);
  visit("date", notification.deliveryDate);
  visit("delivered", notification.actualDeliveryDate);
  visit("years", interval.year);
  visit("months", interval.month);
  visit("days", interval.day);
  visit("hours", interval.hour);
  visit("minutes", interval.minute);
  visit("seconds", interval.second);
}

GVariant* wrapped(const std::string& text) {
  return g_variant_new_fixed_array(G_VARIANT_TYPE_BYTE, text.data(), text.size(), 1);
}
GVariant* wrapped(std::int64_t number) {
  return g_variant_new_int64(number);
}
GVariant* wrapped(Date date) {
  return wrapped(std::int64_t{date.time_since_epoch().count()});
}

void unwrap(GVariant* value, std::optional<std::string>& text) {
  if (!g_variant_is_of_type(value, G_VARIANT_TYPE_BYTESTRING)) return;
  gsize size = 0;
  const auto* bytes = static_cast<const char*>(g_variant_get_fixed_array(value, &size, 1));
  text.emplace(bytes ? bytes : "", size);
}
void unwrap(GVariant* value, std::optional<std::int64_t>& number) {
  if (g_variant_is_of_type(value, G_VARIANT_TYPE_INT64)) number = g_variant_get_int64(value);
}
void unwrap(GVariant* value, std::optional<Date>& date) {
  std::optional<std::int64_t> number;
  unwrap(value, number);
  if (number) date = Date(Date::duration(*number));
}

}  // namespace

BusMessage messageToRunning(const std::string& name, const char* path, const char* interface,
                            const char* method, GVariant* body) {
  BusMessage message(g_dbus_message_new_method_call(name.c_str(), path, interface, method));
  g_dbus_message_set_flags(message.get(), G_DBUS_MESSAGE_FLAGS_NO_AUTO_START);
  g_dbus_message_set_body(message.get(), body);
  return message;
}

GVariant* variantOf(const UserNotification& notification) {
  GVariantBuilder members;
  g_variant_builder_init(&members, G_VARIANT_TYPE_VARDICT);
  const DateComponents interval = notification.deliveryRepeatInterval.value_or(DateComponents());
  visitMembers(notification, interval, [&](const char* name, const auto& member) {
    if (member) g_variant_builder_add(&members, "{sv}", name, wrapped(*member));
  });
  return g_variant_builder_end(&members);
}

UserNotification notificationIn(GVariant* dictionary) {
  UserNotification notification;
  DateComponents interval;
  visitMembers(notification, interval, [&](const char* name, auto& member) {
    const Variant value(g_variant_lookup_value(dictionary, name, nullptr));
    if (value) unwrap(value.get(), member);
  });
  if (interval != DateComponents()) notification.deliveryRepeatInterval = interval;
  return notification;
}

NotificationActivation activationIn(GVariant* arguments) {
  const Variant dictionary(g_variant_get_child_value(arguments, 0));
  gboolean isActionButton = FALSE;
  if (g_variant_n_children(arguments) > 1) g_variant_get_child(arguments, 1, "b", &isActionButton);
  return {notificationIn(dictionary.get()), isActionButton != FALSE};
}

std::string storeIn(GVariant* arguments) {
  const char* store = nullptr;
  g_variant_get_child(arguments, 0, "^&ay", &store);
  return store;
}

}  // namespace Varnel::Platform::Linux
