// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Linux/Notifications/Module.h>

#include <Varnel/Platform/Linux/Notifications/BusNotificationServer.h>
#include <Varnel/Platform/Ports/NotificationServer.h>

Varnel::Platform::NotificationServer* varnelMakeNotificationServer(
    Varnel::Platform::SystemLog& systemLog, const Varnel::Platform::NotificationSource& source,
    std::chrono::milliseconds patience) {
  return Varnel::Platform::Linux::makeBusNotificationServer(systemLog, source, patience).release();
}
