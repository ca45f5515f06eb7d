// SPDX-License-Identifier: MIT
#pragma once

#include <chrono>
#include <memory>

namespace Varnel::Platform {
class NotificationServer;
class SystemLog;
struct NotificationSource;
}  // namespace Varnel::Platform

namespace Varnel::Platform::Linux {

inline constexpr const char* notificationService = "org.freedesktop.Notifications";

/// The server on the session bus. Part of the module: `makeNotificationServer` loads it.
[[nodiscard]] std::unique_ptr<NotificationServer> makeBusNotificationServer(
    SystemLog& systemLog, const NotificationSource& source, std::chrono::milliseconds patience);

}  // namespace Varnel::Platform::Linux
