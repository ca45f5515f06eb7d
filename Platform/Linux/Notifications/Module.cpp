// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Linux/Notifications/Module.h>

#include <Varnel/Platform/Linux/Notifications/BusNotificationServer.h>
#include <Varnel/Platform/Linux/Notifications/NotifierConnection.h>
#include <Varnel/Platform/Linux/Notifications/SessionBus.h>
#include <Varnel/Platform/Ports/NotificationServer.h>

using namespace Varnel::Platform;
using namespace Varnel::Platform::Linux;

NotificationServer* varnelMakeNotificationServer(SystemLog& systemLog,
                                                 const NotificationSource& source,
                                                 std::chrono::milliseconds patience) {
  return makeBusNotificationServer(systemLog, source, makeSessionBus(patience)).release();
}

DelivererConnection* varnelMakeNotifierConnection(const std::string& baseIdentifier,
                                                  const std::string& store,
                                                  const MakeDeliverer& makeDeliverer) {
  return new NotifierConnection(makeSessionBus(), baseIdentifier, store, makeDeliverer);
}
