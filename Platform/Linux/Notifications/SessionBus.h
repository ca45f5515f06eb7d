// SPDX-License-Identifier: MIT
#pragma once

#include <gio/gio.h>

#include <chrono>
#include <functional>
#include <memory>
#include <string>
#include <string_view>
#include <vector>

#include <Varnel/Platform/Linux/MainLoop/MainLoopBlock.h>
#include <Varnel/Platform/Linux/Notifications/NotificationMessages.h>
#include <Varnel/Platform/Values/UniqueHandle.h>

namespace Varnel::Platform::Linux {

/// Why a message came to nothing: the bus's name of the error, empty where there is no bus, and the
/// text.
struct BusFailure final {
  /// The name where nobody has answered, who may yet do so the next time.
  static constexpr const char* noReply = "org.freedesktop.DBus.Error.NoReply";

  std::string name;
  std::string text;

  /// Whether nobody was there to take the message, nor anybody that could be started.
  [[nodiscard]] bool isNobodyThere() const;
  /// Whether there is no bus, or it knows of no such service.
  [[nodiscard]] bool isUnknownThere() const;
};

/// The signals to hear of; what is null is any.
struct SignalMatch final {
  const char* sender = nullptr;
  const char* interface = nullptr;
  const char* name = nullptr;
  const char* path = nullptr;
  const char* argument = nullptr;  ///< The first, where it is a text.
};

/// An object that other programs may call. The bus checks calls against the interface.
struct ServedObject final {
  const char* path;
  const char* interface;  ///< As introspection data.
  /// Must answer the invocation, which it owns, once, and must not throw.
  std::function<void(std::string_view method, GVariant* arguments, GDBusMethodInvocation*)> call;
};

/// A connection of our own to the user's session bus, made when needed and again when it was lost.
/// The host's connection, whose end may end the host, is left alone. Main thread only; nothing
/// waits for the bus, which may be there without answering. Owned by shared pointers.
///
///     bus->ask(capabilitiesRequest(), SessionBus::usualTime, [](GDBusMessage* reply, const auto&
///         failure) { … });
class SessionBus final : public std::enable_shared_from_this<SessionBus> {
 public:
  /// Given the failure, or null. Must not throw.
  using Connected = std::function<void(const BusFailure* failure)>;
  /// Given the reply, which has a sender, or null and the failure. Must not throw.
  using Reply = std::function<void(GDBusMessage* reply, const BusFailure& failure)>;
  /// Given the sender, the member and the body of a signal. Must not throw.
  using Signal = std::function<void(const char* sender, const char* name, GVariant* body)>;
  /// Ends what was asked for when it goes.
  using Subscription = std::shared_ptr<void>;

  /// How long to wait for a reply: as GIO does by default, or as long as the other side is there.
  static constexpr std::chrono::seconds usualTime{25};
  static constexpr std::chrono::milliseconds unlimitedTime{G_MAXINT};

  /// `patience` is how long a connection may take.
  explicit SessionBus(std::chrono::milliseconds patience);
  ~SessionBus();
  SessionBus(const SessionBus&) = delete;
  SessionBus& operator=(const SessionBus&) = delete;

  /// Hears these signals, on the present connection and on later ones.
  [[nodiscard]] Subscription listen(const SignalMatch& match, Signal signal);
  /// Hears who comes and goes under a name: `changed` is given the unique names before and after,
  /// which are empty for none.
  [[nodiscard]] Subscription watch(
      const std::string& name,
      std::function<void(const std::string& before, const std::string& after)> changed);

  /// Answers calls on connections that are made from now on.
  void serve(ServedObject object);
  /// Is called on each connection that is made, before it is used for anything else, and when one
  /// was lost. Must not throw.
  void setObserver(std::function<void(bool isConnected)> observer);

  /// Connects if need be. Calls `use` at once if there is a connection, and otherwise when the
  /// attempt to connect has succeeded or failed.
  void connect(Connected use);

  /// Sends a message over the present connection, without waiting for the reply. There must be one.
  void send(const BusMessage& message, std::chrono::milliseconds time, Reply reply);
  /// Sends it once there is a connection.
  void ask(BusMessage message, std::chrono::milliseconds time, Reply reply);
  /// Sends a message that nobody answers, if there is a connection.
  void tell(const BusMessage& message);

  /// Whether a connection or a reply is still to come.
  [[nodiscard]] bool isBusy() const { return attempt_ || awaitedReplies_ > 0; }

  /// The bus's unique name. Empty without a connection.
  [[nodiscard]] std::string name() const;

 private:
  struct Attempt;
  struct AwaitedReply;
  class Listener;

  static void disconnect(GDBusConnection* connection);
  using Connection = UniqueHandle<GDBusConnection*, disconnect>;

  [[nodiscard]] bool isConnected() const;
  void start();
  static void replied(GObject* connection, GAsyncResult* result, gpointer awaited) noexcept;
  static void closed(GDBusConnection* connection, gboolean, GError*, gpointer self) noexcept;
  static Connection open(GCancellable* cancellable, BusFailure& failure);
  void finish(const Attempt* attempt, Connection connection, const BusFailure& failure);
  void adopt(Connection connection);
  void release();
  void publish(const ServedObject& object) const;

  const std::chrono::milliseconds patience_;
  std::shared_ptr<Attempt> attempt_;  // The connection that is being made.
  AttachedSource timer_;              // Ends the attempt.
  std::vector<Connected> waiting_;    // Called at the end of the attempt.
  std::vector<std::weak_ptr<Listener>> listeners_;
  std::vector<ServedObject> objects_;
  std::function<void(bool isConnected)> observer_;
  Connection connection_;
  int awaitedReplies_ = 0;
};

[[nodiscard]] std::shared_ptr<SessionBus> makeSessionBus(
    std::chrono::milliseconds patience = std::chrono::seconds(10));

}  // namespace Varnel::Platform::Linux
