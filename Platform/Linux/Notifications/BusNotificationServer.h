// SPDX-License-Identifier: MIT
#pragma once

#include <memory>

namespace Varnel::Platform {
class NotificationServer;
class SystemLog;
struct NotificationSource;
}  // namespace Varnel::Platform

namespace Varnel::Platform::Linux {

class SessionBus;

inline constexpr const char* sessionBusModule = "libvarnel-session-bus.so";
inline constexpr const char* notificationService = "org.freedesktop.Notifications";

/// The server on the session bus. Part of the module: `makeNotificationServer` loads it.
[[nodiscard]] std::unique_ptr<NotificationServer> makeBusNotificationServer(
    SystemLog& systemLog, const NotificationSource& source, std::shared_ptr<SessionBus> bus);

}  // namespace Varnel::Platform::Linux
