// SPDX-License-Identifier: MIT
#include <Tests/Contract/NotificationWorlds.h>

#include <gio/gio.h>

#include <map>
#include <optional>

#include <Varnel/Platform/Linux/Adapters.h>
#include <Varnel/Platform/Linux/Notifications/NotificationMessages.h>
#include <Varnel/Platform/Ports/MainQueue.h>
#include <Varnel/Platform/Testing/CapturedOutput.h>

namespace Varnel::Platform::Contract {
namespace {

using Text = UniqueHandle<char*, g_free>;
using Connection = UniqueHandle<GDBusConnection*, g_object_unref>;
using Interface = UniqueHandle<GDBusNodeInfo*, g_dbus_node_info_unref>;

constexpr const char* interface =
    "<node><interface name='org.freedesktop.Notifications'>"
    "<method name='GetCapabilities'><arg type='as' direction='out'/></method>"
    "<method name='Notify'><arg type='s' direction='in'/><arg type='u' direction='in'/>"
    "<arg type='s' direction='in'/><arg type='s' direction='in'/><arg type='s' direction='in'/>"
    "<arg type='as' direction='in'/><arg type='a{sv}' direction='in'/><arg type='i' "
    "direction='in'/>"
    "<arg type='u' direction='out'/></method>"
    "<method name='CloseNotification'><arg type='u' direction='in'/></method>"
    "</interface></node>";

// A session bus of this test alone.
class Bus final {
 public:
  Bus() { g_test_dbus_up(bus_.get()); }
  ~Bus() { g_test_dbus_stop(bus_.get()); }
  Bus(const Bus&) = delete;
  Bus& operator=(const Bus&) = delete;

 private:
  const UniqueHandle<GTestDBus*, g_object_unref> bus_{g_test_dbus_new(G_TEST_DBUS_NONE)};
};

// The desktop's server. It answers on the main thread.
class Desktop final {
 public:
  Desktop()
      : connection_(g_dbus_connection_new_for_address_sync(
            g_getenv("DBUS_SESSION_BUS_ADDRESS"),
            static_cast<GDBusConnectionFlags>(G_DBUS_CONNECTION_FLAGS_AUTHENTICATION_CLIENT |
                                              G_DBUS_CONNECTION_FLAGS_MESSAGE_BUS_CONNECTION),
            nullptr, nullptr, nullptr)) {
    static const GDBusInterfaceVTable methods{&Desktop::call, nullptr, nullptr, {}};
    const Interface description(g_dbus_node_info_new_for_xml(interface, nullptr));
    g_dbus_connection_register_object(connection_.get(), Linux::notificationPath,
                                      description.get()->interfaces[0], &methods, this, nullptr,
                                      nullptr);
    const UniqueHandle<GVariant*, g_variant_unref> reply(g_dbus_connection_call_sync(
        connection_.get(), "org.freedesktop.DBus", "/org/freedesktop/DBus", "org.freedesktop.DBus",
        "RequestName", g_variant_new("(su)", Linux::notificationService, 0), nullptr,
        G_DBUS_CALL_FLAGS_NONE, -1, nullptr, nullptr));
  }
  ~Desktop() { g_dbus_connection_close_sync(connection_.get(), nullptr, nullptr); }
  Desktop(const Desktop&) = delete;
  Desktop& operator=(const Desktop&) = delete;

  std::vector<Banner> banners() const {
    std::vector<Banner> banners;
    for (const auto& [number, banner] : shown_) banners.push_back(banner);
    return banners;
  }
  void activate(const std::string& title) {
    emit("ActionInvoked", g_variant_new("(us)", numbers_.at(title), Linux::defaultAction));
  }
  void close(const std::string& title, std::uint32_t reason) { close(numbers_.at(title), reason); }

 private:
  static void call(GDBusConnection*, const char*, const char*, const char*, const char* method,
                   GVariant* arguments, GDBusMethodInvocation* invocation, gpointer desktop) {
    auto& self = *static_cast<Desktop*>(desktop);
    GVariant* answer = nullptr;
    if (std::string_view(method) == "GetCapabilities") {
      const char* const capabilities[] = {"actions", "body", nullptr};
      answer = g_variant_new("(^as)", capabilities);
    } else if (std::string_view(method) == "Notify") {
      answer = g_variant_new("(u)", self.show(arguments));
    } else {
      guint32 number = 0;
      g_variant_get(arguments, "(u)", &number);
      self.close(number, closedByCall);
    }
    g_dbus_method_invocation_return_value(invocation, answer);
  }

  guint32 show(GVariant* arguments) {
    guint32 number = 0;
    const char *title = nullptr, *text = nullptr;
    GVariantIter* actions = nullptr;
    g_variant_get(arguments, "(&su&s&s&sasa{sv}i)", nullptr, &number, nullptr, &title, &text,
                  &actions, nullptr, nullptr);
    if (number == 0) number = ++last_;
    Banner& banner = shown_[number] = {.title = title, .text = text};
    const char *action = nullptr, *name = nullptr;
    while (g_variant_iter_next(actions, "&s", &action) &&
           g_variant_iter_next(actions, "&s", &name)) {
      if (std::string_view(action) == Linux::buttonAction) banner.actionTitle = name;
      if (std::string_view(action) == Linux::dismissAction) banner.dismissTitle = name;
    }
    g_variant_iter_free(actions);
    numbers_[title] = number;
    return number;
  }
  void close(guint32 number, guint32 reason) {
    if (shown_.erase(number) > 0) emit("NotificationClosed", g_variant_new("(uu)", number, reason));
  }
  void emit(const char* signal, GVariant* body) {
    g_dbus_connection_emit_signal(connection_.get(), nullptr, Linux::notificationPath,
                                  Linux::notificationService, signal, body, nullptr);
  }

  static constexpr guint32 closedByCall = 3;

  const Connection connection_;
  std::map<guint32, Banner> shown_;
  std::map<std::string, guint32> numbers_;  // By title, also of banners that have expired.
  guint32 last_ = 0;
};

class LinuxWorld final : public NotificationServerWorld {
 public:
  LinuxWorld() {
    if (!Text(g_find_program_in_path("dbus-daemon"))) return;
    bus_.emplace();
    startServer();
  }
  [[nodiscard]] std::string obstacle() const override {
    return bus_ ? "" : "There is no program dbus-daemon.";
  }
  NotificationServer& port() override { return *server_; }
  std::vector<Banner> banners() override { return desktop_->banners(); }
  void activate(const std::string& title) override { desktop_->activate(title); }
  void dismiss(const std::string& title) override {
    desktop_->close(title, Linux::dismissedByUser);
  }
  void expire(const std::string& title) override { desktop_->close(title, Linux::expired); }
  void endServer() override { desktop_.reset(); }
  void startServer() override { desktop_.emplace(); }
  void workUntil(const std::function<bool()>& condition) override {
    const auto holds = [&] { return !condition(); };
    EXPECT_TRUE(queue_->runWhile(holds, std::chrono::seconds(30))) << log_.text();
  }

 private:
  const std::unique_ptr<MainQueue> queue_ = Linux::makeMainQueue();
  Testing::CapturedSystemLog log_;
  std::optional<Bus> bus_;
  std::optional<Desktop> desktop_;
  const std::unique_ptr<NotificationServer> server_ = Linux::makeNotificationServer(log_, {});
};
INSTANTIATE_TEST_SUITE_P(Linux, NotificationServerContract, on<LinuxWorld>());

}  // namespace
}  // namespace Varnel::Platform::Contract
