// SPDX-License-Identifier: MIT
#include <Platform/Linux/SessionBus.h>

#include <memory>
#include <utility>

#include <Platform/POSIX/BlockedSignals.h>

namespace Varnel::Platform::Linux {
namespace {

using Text = UniqueHandle<char*, g_free>;

std::string take(GError* error) {
  std::string text = error->message;
  g_error_free(error);
  return text;
}

void finish(GObject* connection, GAsyncResult* result, gpointer data) noexcept {
  const std::unique_ptr<SessionBus::Reply> reply(static_cast<SessionBus::Reply*>(data));
  GError* error = nullptr;
  const BusMessage message(g_dbus_connection_send_message_with_reply_finish(
      G_DBUS_CONNECTION(connection), result, &error));
  if (!message) return (*reply)(nullptr, take(error));
  const auto refusal = errorIn(message.get());
  if (refusal)
    (*reply)(nullptr, *refusal);
  else
    (*reply)(message.get(), {});
}

void dispatch(GDBusConnection*, const char* sender, const char*, const char*, const char* name,
              GVariant* body, gpointer signal) noexcept {
  (*static_cast<SessionBus::Signal*>(signal))(sender, name, body);
}

void release(gpointer signal) noexcept {
  delete static_cast<SessionBus::Signal*>(signal);
}

}  // namespace

SessionBus::SessionBus(Signal signal) : signal_(std::move(signal)) {}

SessionBus::~SessionBus() {
  unsubscribe();
}

void SessionBus::unsubscribe() {
  if (connection_) g_dbus_connection_signal_unsubscribe(connection_.get(), subscription_);
}

void SessionBus::disconnect(GDBusConnection* connection) {
  g_dbus_connection_close(connection, nullptr, nullptr, nullptr);
  g_object_unref(connection);
}

std::string SessionBus::connect() {
  if (connection_ && !g_dbus_connection_is_closed(connection_.get())) return {};
  GError* error = nullptr;
  const Text address(g_dbus_address_get_for_bus_sync(G_BUS_TYPE_SESSION, nullptr, &error));
  if (!address) return take(error);
  constexpr auto flags =
      static_cast<GDBusConnectionFlags>(G_DBUS_CONNECTION_FLAGS_AUTHENTICATION_CLIENT |
                                        G_DBUS_CONNECTION_FLAGS_MESSAGE_BUS_CONNECTION);
  // The first connection of the process starts the thread that serves all of them.
  const POSIX::BlockedSignals inheritedByTheThread;
  UniqueHandle<GDBusConnection*, disconnect> connection(
      g_dbus_connection_new_for_address_sync(address.get(), flags, nullptr, nullptr, &error));
  if (!connection) return take(error);
  // A signal of the lost connection may still be on its way to us.
  unsubscribe();
  connection_ = std::move(connection);
  subscription_ = g_dbus_connection_signal_subscribe(
      connection_.get(), notificationService, notificationService, nullptr, notificationPath,
      nullptr, G_DBUS_SIGNAL_FLAGS_NONE, &dispatch, new Signal(signal_), &release);
  return {};
}

void SessionBus::send(const BusMessage& message, Reply reply) {
  constexpr int defaultTimeout = -1;
  g_dbus_connection_send_message_with_reply(connection_.get(), message.get(),
                                            G_DBUS_SEND_MESSAGE_FLAGS_NONE, defaultTimeout, nullptr,
                                            nullptr, &finish, new Reply(std::move(reply)));
}

void SessionBus::send(const BusMessage& message) {
  g_dbus_connection_send_message(connection_.get(), message.get(), G_DBUS_SEND_MESSAGE_FLAGS_NONE,
                                 nullptr, nullptr);
  g_dbus_connection_flush_sync(connection_.get(), nullptr, nullptr);
}

std::string SessionBus::name() const {
  const char* guid = g_dbus_connection_get_guid(connection_.get());
  return guid ? guid : "";
}

}  // namespace Varnel::Platform::Linux
