// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Linux/Notifications/SessionBus.h>

#include <system_error>
#include <utility>

#include <Varnel/Platform/Concurrency/StartThread.h>
#include <Varnel/Platform/Linux/MainLoop/MainLoopBlock.h>

namespace Varnel::Platform::Linux {
namespace {

using Text = UniqueHandle<char*, g_free>;
using Cancellable = UniqueHandle<GCancellable*, g_object_unref>;

std::string take(GError* error) {
  std::string text = error->message;
  g_error_free(error);
  return text;
}

// While it lives, GIO's answers arrive where the main queue runs, even if the host has made another
// context the thread's default.
class OnMainContext final {
 public:
  OnMainContext()
      : isPushed_(g_main_context_get_thread_default() && g_main_context_acquire(context_)) {
    if (isPushed_) g_main_context_push_thread_default(context_);
  }
  ~OnMainContext() {
    if (!isPushed_) return;
    g_main_context_pop_thread_default(context_);
    g_main_context_release(context_);
  }
  OnMainContext(const OnMainContext&) = delete;
  OnMainContext& operator=(const OnMainContext&) = delete;

 private:
  GMainContext* const context_ = g_main_context_default();
  const bool isPushed_;
};

void dispatch(GDBusConnection*, const char* sender, const char*, const char*, const char* name,
              GVariant* body, gpointer signal) noexcept {
  (*static_cast<SessionBus::Signal*>(signal))(sender, name, body);
}

void release(gpointer signal) noexcept {
  delete static_cast<SessionBus::Signal*>(signal);
}

}  // namespace

struct SessionBus::Attempt {
  const Cancellable cancellable{g_cancellable_new()};
};

struct SessionBus::AwaitedReply {
  std::weak_ptr<SessionBus> bus;
  Reply use;
};

SessionBus::SessionBus(Signal signal, std::chrono::milliseconds patience)
    : signal_(std::move(signal)), patience_(patience) {}

SessionBus::~SessionBus() {
  if (attempt_) g_cancellable_cancel(attempt_->cancellable.get());
  unsubscribe();
}

void SessionBus::connect(Connected use) {
  if (connection_ && !g_dbus_connection_is_closed(connection_.get())) return use({});
  waiting_.push_back(std::move(use));
  if (!attempt_) start();
}

// A bus may accept the connection and then never answer; even asking for its address may start a
// program. After the time is over, the thread finishes that by itself and nobody waits for it. The
// end of the time counts for nothing against a connection that has come: the main loop may have had
// no time for either.
void SessionBus::start() {
  const auto attempt = attempt_ = std::make_shared<Attempt>();
  timer_ = Timer(attach(g_timeout_source_new(static_cast<guint>(patience_.count())),
                        G_PRIORITY_DEFAULT + 1, [this] {
                          g_cancellable_cancel(attempt_->cancellable.get());
                          finish(attempt_, {}, "The session bus does not answer.");
                        }));
  try {
    startThread("session-bus", [weak = weak_from_this(), attempt] {
      std::string error;
      const auto connection = std::make_shared<Connection>(open(attempt->cancellable.get(), error));
      runOnMainLoop([weak, attempt, connection, error] {
        if (const auto self = weak.lock()) self->finish(attempt, std::move(*connection), error);
      });
    }).detach();
  } catch (const std::system_error& failure) {
    finish(attempt, {}, failure.what());
  }
}

SessionBus::Connection SessionBus::open(GCancellable* cancellable, std::string& error) {
  GError* failure = nullptr;
  const Text address(g_dbus_address_get_for_bus_sync(G_BUS_TYPE_SESSION, cancellable, &failure));
  constexpr auto flags =
      static_cast<GDBusConnectionFlags>(G_DBUS_CONNECTION_FLAGS_AUTHENTICATION_CLIENT |
                                        G_DBUS_CONNECTION_FLAGS_MESSAGE_BUS_CONNECTION);
  Connection connection;
  if (address)
    connection = Connection(g_dbus_connection_new_for_address_sync(address.get(), flags, nullptr,
                                                                   cancellable, &failure));
  if (failure) error = take(failure);
  return connection;
}

void SessionBus::finish(std::shared_ptr<Attempt> attempt, Connection connection,
                        const std::string& error) {
  // The attempt was given up.
  if (attempt != attempt_) return;
  if (connection) adopt(std::move(connection));
  attempt_.reset();
  timer_ = Timer();
  for (const Connected& use : std::exchange(waiting_, {})) use(error);
}

void SessionBus::adopt(Connection connection) {
  // A signal of the lost connection may still arrive.
  unsubscribe();
  connection_ = std::move(connection);
  const OnMainContext here;
  const auto subscribe = [this](const char* sender, const char* interface, const char* name,
                                const char* path, const char* argument) {
    return g_dbus_connection_signal_subscribe(connection_.get(), sender, interface, name, path,
                                              argument, G_DBUS_SIGNAL_FLAGS_NONE, &dispatch,
                                              new Signal(signal_), &release);
  };
  constexpr const char* bus = "org.freedesktop.DBus";
  subscriptions_[0] =
      subscribe(notificationService, notificationService, nullptr, notificationPath, nullptr);
  subscriptions_[1] =
      subscribe(bus, bus, "NameOwnerChanged", "/org/freedesktop/DBus", notificationService);
}

void SessionBus::send(const BusMessage& message, Waiting waiting, Reply reply) {
  constexpr int defaultTimeout = -1;
  const OnMainContext here;
  ++awaitedReplies_;
  g_dbus_connection_send_message_with_reply(
      connection_.get(), message.get(), G_DBUS_SEND_MESSAGE_FLAGS_NONE,
      waiting == Waiting::limited ? defaultTimeout : G_MAXINT, nullptr, nullptr, &replied,
      new AwaitedReply{weak_from_this(), std::move(reply)});
}

void SessionBus::replied(GObject* connection, GAsyncResult* result, gpointer data) noexcept {
  const std::unique_ptr<AwaitedReply> awaited(static_cast<AwaitedReply*>(data));
  GError* error = nullptr;
  const BusMessage message(g_dbus_connection_send_message_with_reply_finish(
      G_DBUS_CONNECTION(connection), result, &error));
  if (const auto self = awaited->bus.lock()) --self->awaitedReplies_;
  if (!message) return awaited->use(nullptr, take(error));
  // A message from a real bus always has a sender.
  if (!g_dbus_message_get_sender(message.get()))
    return awaited->use(nullptr, "The session bus does not tell who answers.");
  const auto refusal = errorIn(message.get());
  if (refusal)
    awaited->use(nullptr, *refusal);
  else
    awaited->use(message.get(), {});
}

std::string SessionBus::name() const {
  const char* guid = connection_ ? g_dbus_connection_get_guid(connection_.get()) : nullptr;
  return guid ? guid : "";
}

void SessionBus::unsubscribe() {
  if (!connection_) return;
  for (const guint subscription : subscriptions_)
    g_dbus_connection_signal_unsubscribe(connection_.get(), subscription);
}

void SessionBus::disconnect(GDBusConnection* connection) {
  g_dbus_connection_close(connection, nullptr, nullptr, nullptr);
  g_object_unref(connection);
}

void SessionBus::destroy(GSource* source) {
  g_source_destroy(source);
  g_source_unref(source);
}

}  // namespace Varnel::Platform::Linux
