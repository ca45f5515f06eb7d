// SPDX-License-Identifier: MIT
#pragma once

#include <gio/gio.h>

#include <chrono>
#include <functional>
#include <memory>
#include <string>
#include <vector>

#include <Varnel/Platform/Linux/Notifications/NotificationMessages.h>
#include <Varnel/Platform/Values/UniqueHandle.h>

namespace Varnel::Platform::Linux {

/// A connection of our own to the user's session bus, made when needed and again when it was lost.
/// The host's connection, whose end may end the host, is left alone. Main thread only; nothing
/// waits for the bus, which may be there without answering. Owned by a shared pointer.
///
///     bus->connect([bus](const std::string& error) { if (error.empty()) bus->send(message,
///         SessionBus::Waiting::limited, use); });
class SessionBus final : public std::enable_shared_from_this<SessionBus> {
 public:
  /// Given the error, or an empty text. Must not throw.
  using Connected = std::function<void(const std::string& error)>;
  /// Given the reply, which has a sender, or null and the error. Must not throw.
  using Reply = std::function<void(GDBusMessage* reply, const std::string& error)>;
  /// Given the sender, the member and the body of a signal. Must not throw.
  using Signal = std::function<void(const char* sender, const char* name, GVariant* body)>;

  /// How long to wait for a reply.
  enum class Waiting {
    limited,   ///< As long as GIO does by default: 25 seconds.
    unlimited  ///< As long as the other side is there.
  };

  /// Signals of the notification service, and those of the bus about who serves it, go to `signal`,
  /// as long as the object lives. `patience` is
  /// how long a connection may take.
  SessionBus(Signal signal, std::chrono::milliseconds patience);
  ~SessionBus();
  SessionBus(const SessionBus&) = delete;
  SessionBus& operator=(const SessionBus&) = delete;

  /// Connects if need be. Calls `use` at once if there is a connection, and otherwise when the
  /// attempt to connect has succeeded or failed.
  void connect(Connected use);

  /// Sends a message over the present connection, without waiting for the reply. There must be one.
  void send(const BusMessage& message, Waiting waiting, Reply reply);

  /// Whether a connection or a reply is still to come.
  [[nodiscard]] bool isBusy() const { return attempt_ || awaitedReplies_ > 0; }

  /// The bus's unique name. Empty without a connection.
  [[nodiscard]] std::string name() const;

 private:
  struct Attempt;
  struct AwaitedReply;

  static void destroy(GSource* source);
  static void disconnect(GDBusConnection* connection);
  using Connection = UniqueHandle<GDBusConnection*, disconnect>;
  using Timer = UniqueHandle<GSource*, destroy>;

  void start();
  static void replied(GObject* connection, GAsyncResult* result, gpointer awaited) noexcept;
  static Connection open(GCancellable* cancellable, std::string& error);
  void finish(std::shared_ptr<Attempt> attempt, Connection connection, const std::string& error);
  void adopt(Connection connection);
  void unsubscribe();

  const Signal signal_;
  const std::chrono::milliseconds patience_;
  std::shared_ptr<Attempt> attempt_;  // The connection that is being made.
  Timer timer_;                       // Ends the attempt.
  std::vector<Connected> waiting_;    // Called at the end of the attempt.
  Connection connection_;
  guint subscriptions_[2] = {};
  int awaitedReplies_ = 0;
};

}  // namespace Varnel::Platform::Linux
