// SPDX-License-Identifier: MIT
#pragma once

#include <chrono>

namespace Varnel::Platform {
class NotificationServer;
class SystemLog;
struct NotificationSource;
}  // namespace Varnel::Platform

/// The entry of the module that speaks to the session bus through GIO. The caller owns the server.
extern "C" __attribute__((visibility("default"))) Varnel::Platform::NotificationServer*
varnelMakeNotificationServer(Varnel::Platform::SystemLog& systemLog,
                             const Varnel::Platform::NotificationSource& source,
                             std::chrono::milliseconds patience);
