// SPDX-License-Identifier: MIT
// BannerRecorder: a notification server without a screen. It prints the title of each banner that
// it is asked to show, in a line.
#include <gio/gio.h>

#include <cstdio>

namespace {

constexpr const char* interface = R"(<node>
  <interface name='org.freedesktop.Notifications'>
    <method name='GetCapabilities'><arg type='as' direction='out'/></method>
    <method name='Notify'>
      <arg type='s' direction='in'/><arg type='u' direction='in'/><arg type='s' direction='in'/>
      <arg type='s' direction='in'/><arg type='s' direction='in'/><arg type='as' direction='in'/>
      <arg type='a{sv}' direction='in'/><arg type='i' direction='in'/>
      <arg type='u' direction='out'/>
    </method>
    <method name='CloseNotification'><arg type='u' direction='in'/></method>
  </interface>
</node>)";

void call(GDBusConnection*, const char*, const char*, const char*, const char* method,
          GVariant* arguments, GDBusMethodInvocation* invocation, gpointer) {
  static guint32 number = 0;
  GVariant* result = nullptr;
  if (g_str_equal(method, "GetCapabilities")) {
    const char* const capabilities[] = {"actions", nullptr};
    result = g_variant_new("(^as)", capabilities);
  } else if (g_str_equal(method, "Notify")) {
    const char* title = nullptr;
    g_variant_get_child(arguments, 3, "&s", &title);
    std::puts(title);
    std::fflush(stdout);
    result = g_variant_new("(u)", ++number);
  }
  g_dbus_method_invocation_return_value(invocation, result);
}

constexpr GDBusInterfaceVTable table{&call, nullptr, nullptr, {}};

}  // namespace

int main() {
  g_bus_own_name(
      G_BUS_TYPE_SESSION, "org.freedesktop.Notifications", G_BUS_NAME_OWNER_FLAGS_NONE,
      [](GDBusConnection* connection, const char*, gpointer) {
        GDBusNodeInfo* node = g_dbus_node_info_new_for_xml(interface, nullptr);
        g_dbus_connection_register_object(connection, "/org/freedesktop/Notifications",
                                          node->interfaces[0], &table, nullptr, nullptr, nullptr);
      },
      nullptr, nullptr, nullptr, nullptr);
  g_main_loop_run(g_main_loop_new(nullptr, FALSE));
}
