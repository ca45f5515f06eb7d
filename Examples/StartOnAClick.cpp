// SPDX-License-Identifier: MIT
// StartOnAClick plan: plans a reminder in a week, and ends.
// StartOnAClick serve [ENDPOINT]: the application itself, as the session bus starts it when the
// user has clicked the reminder. It says what it was started for, and ends once its events are at
// the endpoint.
#include <Varnel/Context/ApplicationData.h>
#include <Varnel/Platform/Ports/MainQueue.h>
#include <Varnel/Platform/Ports/Ports.h>
#include <Varnel/Platform/Ports/UserNotificationCenter.h>
#include <Varnel/Reminders/SchedulerService.h>
#include <Varnel/Reminders/UserNotificationRouter.h>
#include <Varnel/Tallyhouse/AnalyticsTracker.h>
#include <Varnel/Tallyhouse/SpoolingTransport.h>
#include <gio/gio.h>

#include <chrono>
#include <functional>
#include <iostream>
#include <memory>
#include <string_view>

using namespace Varnel;
using namespace std::chrono_literals;

namespace {

constexpr const char* applicationName = "com.example.StartOnAClick";
constexpr const char* applicationPath = "/com/example/StartOnAClick";
constexpr const char* applicationInterface = R"(<node>
  <interface name='org.freedesktop.Application'>
    <method name='Activate'><arg type='a{sv}' direction='in'/></method>
    <method name='ActivateAction'>
      <arg type='s' direction='in'/><arg type='av' direction='in'/>
      <arg type='a{sv}' direction='in'/>
    </method>
  </interface>
</node>)";

using Activated = std::function<void(std::string_view method)>;

void call(GDBusConnection*, const char*, const char*, const char*, const char* method, GVariant*,
          GDBusMethodInvocation* invocation, gpointer activated) {
  (*static_cast<Activated*>(activated))(method);
  g_dbus_method_invocation_return_value(invocation, nullptr);
}

// The application on the session bus, as any desktop program is.
void becomeActivatable(Activated& activated) {
  static constexpr GDBusInterfaceVTable table{&call, nullptr, nullptr, {}};
  g_bus_own_name(
      G_BUS_TYPE_SESSION, applicationName, G_BUS_NAME_OWNER_FLAGS_NONE,
      [](GDBusConnection* connection, const char*, gpointer application) {
        GDBusNodeInfo* node = g_dbus_node_info_new_for_xml(applicationInterface, nullptr);
        g_dbus_connection_register_object(connection, applicationPath, node->interfaces[0], &table,
                                          application, nullptr, nullptr);
        g_dbus_node_info_unref(node);
      },
      nullptr, nullptr, &activated, nullptr);
}

std::shared_ptr<Tallyhouse::AnalyticsTracker> makeTracker(
    const std::shared_ptr<Tallyhouse::SpoolingTransport>& transport) {
  return transport ? std::make_shared<Tallyhouse::AnalyticsTracker>(transport,
                                                                    Tallyhouse::Consent::granted)
                   : std::make_shared<Tallyhouse::AnalyticsTracker>();
}

}  // namespace

int main(int count, char** arguments) {
  const std::string_view command = count > 1 ? arguments[1] : "";
  Platform::MainQueue& mainQueue = Platform::processPorts().mainQueue;
  std::shared_ptr<Tallyhouse::SpoolingTransport> transport;
  if (count > 2)
    transport = Tallyhouse::SpoolingTransport::make(
        {.endpoint = *Platform::URL::parse(arguments[2]),
         .trackingID = "EX-1",
         .clientID = "12.34",
         .spoolPath = ApplicationData::analyticsSpoolPath(),
         .plainHTTP = Tallyhouse::SpoolingTransport::PlainHTTP::allowed});

  // At each start: router, service and the period that the user chose, here always a week.
  UserNotificationRouter router;
  SchedulerService reminders(makeTracker(transport), router);
  reminders.setSchedulePeriod(SchedulePeriodOption::weekly);
  Platform::UserNotificationCenter& center = router.userNotificationCenter();
  if (command == "plan") {
    mainQueue.runWhile([&] { return center.isBusy(); }, 3s);
    return reminders.failure() ? 1 : 0;
  }

  bool isActivated = false, isHandled = false;
  router.register_("SchedulerNotification", [&](const auto& notification, auto kind) {
    if (kind == UserNotificationRouter::EventKind::didDeliver) return;
    std::cout << "started for " << *notification.title << ", token "
              << notification.activationToken.value_or("none") << std::endl;
    isHandled = true;
  });
  router.handlePendingLaunch();
  Activated activated = [&](std::string_view method) {
    std::cout << method << std::endl;
    isActivated = true;
  };
  becomeActivatable(activated);
  mainQueue.runWhile([&] { return !isActivated || !isHandled || center.isBusy(); });
  return !transport || transport->drain(10s) ? 0 : 1;
}
