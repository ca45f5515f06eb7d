// SPDX-License-Identifier: MIT
#pragma once

#include <gio/gio.h>

#include <functional>
#include <string>

#include <Platform/Generic/UniqueHandle.h>
#include <Platform/Linux/NotificationMessages.h>

namespace Varnel::Platform::Linux {

/// A connection of our own to the user's session bus, made when needed and again when it was lost.
/// The host's connection, whose end may end the host, is left alone. Main thread only.
class SessionBus final {
 public:
  /// Gets the reply, or null and what went wrong. Must not throw.
  using Reply = std::function<void(GDBusMessage* reply, const std::string& error)>;
  /// Gets the sender, the member and the body of a signal. Must not throw.
  using Signal = std::function<void(const char* sender, const char* name, GVariant* body)>;

  /// Signals of the notification service go to `signal`, as long as the object lives.
  explicit SessionBus(Signal signal);
  ~SessionBus();
  SessionBus(const SessionBus&) = delete;
  SessionBus& operator=(const SessionBus&) = delete;

  /// Connects if need be. What went wrong, or nothing.
  [[nodiscard]] std::string connect();

  /// Sends a message, over the connection that must be there, and does not wait for the reply.
  void send(const BusMessage& message, Reply reply);
  /// Sends a message that has no reply. It is on the way when this returns.
  void send(const BusMessage& message);

  /// The bus's own name, which no other bus has.
  [[nodiscard]] std::string name() const;

 private:
  static void disconnect(GDBusConnection* connection);
  void unsubscribe();

  const Signal signal_;
  UniqueHandle<GDBusConnection*, disconnect> connection_;
  guint subscription_ = 0;
};

}  // namespace Varnel::Platform::Linux
