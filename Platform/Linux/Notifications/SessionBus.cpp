// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Linux/Notifications/SessionBus.h>

#include <system_error>
#include <utility>

#include <Varnel/Platform/Concurrency/StartThread.h>

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

using BusInterface = UniqueHandle<GDBusNodeInfo*, g_dbus_node_info_unref>;

constexpr const char* busService = "org.freedesktop.DBus";
constexpr const char* busPath = "/org/freedesktop/DBus";
const std::string errors = "org.freedesktop.DBus.Error.";

BusFailure failureIn(GDBusMessage* reply, std::string text) {
  const char* name = g_dbus_message_get_error_name(reply);
  return {name ? name : "", std::move(text)};
}

// What is short now may not be so later.
bool isPassing(const GError& error) {
  if (error.domain != G_IO_ERROR) return false;
  return error.code == G_IO_ERROR_TOO_MANY_OPEN_FILES || error.code == G_IO_ERROR_TIMED_OUT ||
         error.code == G_IO_ERROR_CLOSED || error.code == G_IO_ERROR_CONNECTION_CLOSED;
}

void call(GDBusConnection*, const char*, const char*, const char*, const char* method,
          GVariant* arguments, GDBusMethodInvocation* invocation, gpointer object) noexcept {
  static_cast<ServedObject*>(object)->call(method, arguments, invocation);
}

}  // namespace

bool BusFailure::isNobodyThere() const {
  return (!name.empty() && isUnknownThere()) || name == errors + "NameHasNoOwner" ||
         name.starts_with(errors + "Spawn.");
}

// The door of a sandbox answers with the second one, too.
bool BusFailure::isUnknownThere() const {
  return name.empty() || name == errors + "ServiceUnknown" || name == errors + "AccessDenied";
}

// Signals that somebody hears, as long as it lives.
class SessionBus::Listener final : public std::enable_shared_from_this<Listener> {
 public:
  Listener(const SignalMatch& match, Signal signal)
      : sender_(match.sender),
        interface_(match.interface),
        name_(match.name),
        path_(match.path),
        argument_(match.argument ? match.argument : ""),
        hasArgument_(match.argument),
        signal_(std::move(signal)) {}
  ~Listener() { detach(); }
  Listener(const Listener&) = delete;
  Listener& operator=(const Listener&) = delete;

  void attach(GDBusConnection* connection) {
    detach();
    const OnMainContext here;
    connection_ = Kept(G_DBUS_CONNECTION(g_object_ref(connection)));
    number_ = g_dbus_connection_signal_subscribe(
        connection, sender_, interface_, name_, path_, hasArgument_ ? argument_.c_str() : nullptr,
        G_DBUS_SIGNAL_FLAGS_NONE, &dispatch, new std::weak_ptr(weak_from_this()), &forget);
  }

 private:
  using Kept = UniqueHandle<GDBusConnection*, g_object_unref>;

  static void dispatch(GDBusConnection*, const char* sender, const char*, const char*,
                       const char* name, GVariant* body, gpointer listener) noexcept {
    const auto told = static_cast<std::weak_ptr<Listener>*>(listener)->lock();
    if (told) told->signal_(sender, name, body);
  }
  static void forget(gpointer listener) noexcept {
    delete static_cast<std::weak_ptr<Listener>*>(listener);
  }

  void detach() {
    if (connection_) g_dbus_connection_signal_unsubscribe(connection_.get(), number_);
    connection_ = Kept();
  }

  // Of the texts only the last may be made at run time.
  const char* const sender_;
  const char* const interface_;
  const char* const name_;
  const char* const path_;
  const std::string argument_;
  const bool hasArgument_;
  const Signal signal_;
  Kept connection_;
  guint number_ = 0;
};

struct SessionBus::Attempt {
  const Cancellable cancellable{g_cancellable_new()};
};

struct SessionBus::AwaitedReply {
  std::weak_ptr<SessionBus> bus;
  Reply use;
};

SessionBus::SessionBus(std::chrono::milliseconds patience) : patience_(patience) {}

SessionBus::~SessionBus() {
  if (attempt_) g_cancellable_cancel(attempt_->cancellable.get());
  release();
}

SessionBus::Subscription SessionBus::listen(const SignalMatch& match, Signal signal) {
  std::erase_if(listeners_, [](const auto& each) { return each.expired(); });
  const auto listener = std::make_shared<Listener>(match, std::move(signal));
  listeners_.push_back(listener);
  if (isConnected()) listener->attach(connection_.get());
  return listener;
}

SessionBus::Subscription SessionBus::watch(
    const std::string& name,
    std::function<void(const std::string& before, const std::string& after)> changed) {
  return listen({busService, busService, "NameOwnerChanged", busPath, name.c_str()},
                [changed = std::move(changed)](const char*, const char*, GVariant* body) {
                  if (!g_variant_is_of_type(body, G_VARIANT_TYPE("(sss)"))) return;
                  const char* before = nullptr;
                  const char* after = nullptr;
                  g_variant_get(body, "(&s&s&s)", nullptr, &before, &after);
                  changed(before, after);
                });
}

void SessionBus::serve(ServedObject object) {
  objects_.push_back(std::move(object));
}

void SessionBus::setObserver(std::function<void(bool isConnected)> observer) {
  observer_ = std::move(observer);
}

bool SessionBus::isConnected() const {
  return connection_ && !g_dbus_connection_is_closed(connection_.get());
}

void SessionBus::connect(Connected use) {
  if (isConnected()) return use(nullptr);
  waiting_.push_back(std::move(use));
  if (!attempt_) start();
}

// A bus may accept the connection and then never answer; even asking for its address may start a
// program. After the time is over, the thread finishes that by itself and nobody waits for it. The
// end of the time counts for nothing against a connection that has come: the main loop may have had
// no time for either.
void SessionBus::start() {
  const auto attempt = attempt_ = std::make_shared<Attempt>();
  timer_ = AttachedSource(attach(
      g_timeout_source_new(static_cast<guint>(patience_.count())), G_PRIORITY_DEFAULT + 1, [this] {
        g_cancellable_cancel(attempt_->cancellable.get());
        finish(attempt_.get(), {}, {BusFailure::noReply, "The session bus does not answer."});
      }));
  try {
    startThread("session-bus", [weak = weak_from_this(), attempt] {
      BusFailure failure;
      const auto connection =
          std::make_shared<Connection>(open(attempt->cancellable.get(), failure));
      runOnMainLoop([weak, attempt, connection, failure] {
        if (const auto self = weak.lock())
          self->finish(attempt.get(), std::move(*connection), failure);
      });
    }).detach();
  } catch (const std::system_error& error) {
    finish(attempt.get(), {}, {BusFailure::noReply, error.what()});
  }
}

SessionBus::Connection SessionBus::open(GCancellable* cancellable, BusFailure& failure) {
  GError* error = nullptr;
  const Text address(g_dbus_address_get_for_bus_sync(G_BUS_TYPE_SESSION, cancellable, &error));
  constexpr auto flags =
      static_cast<GDBusConnectionFlags>(G_DBUS_CONNECTION_FLAGS_AUTHENTICATION_CLIENT |
                                        G_DBUS_CONNECTION_FLAGS_MESSAGE_BUS_CONNECTION);
  Connection connection;
  if (address)
    connection = Connection(
        g_dbus_connection_new_for_address_sync(address.get(), flags, nullptr, cancellable, &error));
  if (error && isPassing(*error)) failure.name = BusFailure::noReply;
  if (error) failure.text = take(error);
  return connection;
}

void SessionBus::finish(const Attempt* attempt, Connection connection, const BusFailure& failure) {
  // The attempt was given up.
  if (attempt != attempt_.get()) return;
  const bool hasSucceeded{connection};
  if (hasSucceeded) adopt(std::move(connection));
  attempt_.reset();
  timer_ = AttachedSource();
  for (const Connected& use : std::exchange(waiting_, {})) use(hasSucceeded ? nullptr : &failure);
}

void SessionBus::adopt(Connection connection) {
  // A signal of the lost connection may still arrive.
  release();
  connection_ = std::move(connection);
  const OnMainContext here;
  g_signal_connect(connection_.get(), "closed", G_CALLBACK(closed), this);
  for (const auto& each : listeners_)
    if (const auto listener = each.lock()) listener->attach(connection_.get());
  for (const ServedObject& object : objects_) publish(object);
  if (observer_) observer_(true);
}

void SessionBus::publish(const ServedObject& object) const {
  static constexpr GDBusInterfaceVTable table{&call, nullptr, nullptr, {}};
  const BusInterface node(g_dbus_node_info_new_for_xml(object.interface, nullptr));
  g_dbus_connection_register_object(
      connection_.get(), object.path, node.get()->interfaces[0], &table, new ServedObject(object),
      [](gpointer kept) { delete static_cast<ServedObject*>(kept); }, nullptr);
}

void SessionBus::closed(GDBusConnection* connection, gboolean, GError*, gpointer self) noexcept {
  auto& bus = *static_cast<SessionBus*>(self);
  if (connection == bus.connection_.get() && bus.observer_) bus.observer_(false);
}

void SessionBus::send(const BusMessage& message, std::chrono::milliseconds time, Reply reply) {
  const OnMainContext here;
  ++awaitedReplies_;
  g_dbus_connection_send_message_with_reply(
      connection_.get(), message.get(), G_DBUS_SEND_MESSAGE_FLAGS_NONE,
      static_cast<int>(time.count()), nullptr, nullptr, &replied,
      new AwaitedReply{weak_from_this(), std::move(reply)});
}

void SessionBus::ask(BusMessage message, std::chrono::milliseconds time, Reply reply) {
  const auto kept = std::make_shared<BusMessage>(std::move(message));
  connect(
      [weak = weak_from_this(), kept, time, reply = std::move(reply)](const BusFailure* failure) {
        const auto self = weak.lock();
        if (self && !failure) return self->send(*kept, time, reply);
        reply(nullptr, failure ? *failure : BusFailure());
      });
}

void SessionBus::tell(const BusMessage& message) {
  g_dbus_message_set_flags(message.get(),
                           static_cast<GDBusMessageFlags>(g_dbus_message_get_flags(message.get()) |
                                                          G_DBUS_MESSAGE_FLAGS_NO_REPLY_EXPECTED));
  if (isConnected())
    g_dbus_connection_send_message(connection_.get(), message.get(), G_DBUS_SEND_MESSAGE_FLAGS_NONE,
                                   nullptr, nullptr);
}

void SessionBus::replied(GObject* connection, GAsyncResult* result, gpointer data) noexcept {
  const std::unique_ptr<AwaitedReply> awaited(static_cast<AwaitedReply*>(data));
  GError* error = nullptr;
  const BusMessage message(g_dbus_connection_send_message_with_reply_finish(
      G_DBUS_CONNECTION(connection), result, &error));
  if (const auto self = awaited->bus.lock()) --self->awaitedReplies_;
  if (!message) return awaited->use(nullptr, {BusFailure::noReply, take(error)});
  // A message from a real bus always has a sender.
  if (!g_dbus_message_get_sender(message.get()))
    return awaited->use(nullptr, {"", "The session bus does not tell who answers."});
  const auto refusal = errorIn(message.get());
  if (refusal)
    awaited->use(nullptr, failureIn(message.get(), *refusal));
  else
    awaited->use(message.get(), {});
}

std::string SessionBus::name() const {
  const char* guid = connection_ ? g_dbus_connection_get_guid(connection_.get()) : nullptr;
  return guid ? guid : "";
}

void SessionBus::release() {
  if (connection_) g_signal_handlers_disconnect_by_data(connection_.get(), this);
}

void SessionBus::disconnect(GDBusConnection* connection) {
  g_dbus_connection_close(connection, nullptr, nullptr, nullptr);
  g_object_unref(connection);
}

std::shared_ptr<SessionBus> makeSessionBus(std::chrono::milliseconds patience) {
  return std::make_shared<SessionBus>(patience);
}

}  // namespace Varnel::Platform::Linux
