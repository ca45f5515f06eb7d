// SPDX-License-Identifier: MIT
#pragma once

#include <gio/gio.h>

#include <string>

#include <Varnel/Platform/Generic/NotificationHosts.h>
#include <Varnel/Platform/Linux/Notifications/NotificationMessages.h>
#include <Varnel/Platform/Values/UserNotification.h>

/// What the notifier and the running applications say to each other on the session bus.
namespace Varnel::Platform::Linux {

/// The name bears the major version of the stores that its owner delivers from.
inline constexpr const char* notifierName = "com.quennel.Varnel.Notifier1";
inline constexpr const char* notifierPath = "/com/quennel/Varnel/Notifier";

/// `Changed` tells that the store with this path has changed, which the notifier's own environment
/// may not lead to, and answers whether the notifier stays for it.
inline constexpr const char* notifierInterface = R"(<node>
  <interface name='com.quennel.Varnel.Notifier1'>
    <method name='Changed'><arg type='ay' direction='in'/><arg type='b' direction='out'/></method>
  </interface>
</node>)";

inline constexpr const char* hostInterfaceName = "com.quennel.Varnel.Host1";
inline constexpr const char* hostPath = "/com/quennel/Varnel/Host";

/// A notification is a dictionary; in `DidActivate` it is followed by whether the action button was
/// clicked.
inline constexpr const char* hostInterface = R"(<node>
  <interface name='com.quennel.Varnel.Host1'>
    <method name='ShouldPresent'><arg type='a{sv}' direction='in'/><arg type='b' direction='out'/></method>
    <method name='DidDeliver'><arg type='a{sv}' direction='in'/></method>
    <method name='DidActivate'><arg type='a{sv}' direction='in'/><arg type='b' direction='in'/></method>
  </interface>
</node>)";

/// What nobody starts in order to answer it.
[[nodiscard]] BusMessage messageToRunning(const std::string& name, const char* path,
                                          const char* interface, const char* method,
                                          GVariant* body);

/// Texts go byte by byte, whatever they hold.
[[nodiscard]] GVariant* variantOf(const UserNotification& notification);
/// What has not the right type is left out.
[[nodiscard]] UserNotification notificationIn(GVariant* dictionary);

/// The arguments of a call to a host. Without a second one it is no click on the action button.
[[nodiscard]] NotificationActivation activationIn(GVariant* arguments);
/// The argument of `Changed`.
[[nodiscard]] std::string storeIn(GVariant* arguments);

}  // namespace Varnel::Platform::Linux
