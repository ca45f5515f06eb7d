// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Ports/ApplicationLauncher.h>

#include <gio/gdesktopappinfo.h>

#include <algorithm>
#include <memory>
#include <system_error>
#include <utility>

#include <Varnel/Platform/Linux/Adapters.h>
#include <Varnel/Platform/Linux/Notifications/SessionBus.h>
#include <Varnel/Platform/Linux/Process/DesktopEntry.h>
#include <Varnel/Platform/Values/UniqueHandle.h>

namespace Varnel::Platform::Linux {
namespace {

using Application = UniqueHandle<GDesktopAppInfo*, g_object_unref>;
using Context = UniqueHandle<GAppLaunchContext*, g_object_unref>;
using Failure = std::optional<PlatformError>;
using Answer = std::function<void(const Failure& error)>;

constexpr const char* interface = "org.freedesktop.Application";

Failure failureOf(const std::string& text) {
  return PlatformError("ApplicationLauncher", 0, {{std::string(localizedDescriptionKey), text}});
}

// The object of an application on the bus, as the desktop entry standard makes it of its name.
std::string pathOf(const std::string& name) {
  std::string path = "/" + name;
  std::replace(path.begin(), path.end(), '.', '/');
  std::replace(path.begin(), path.end(), '-', '_');
  return path;
}

GVariant* platformData(const std::string& activationToken) {
  GVariantBuilder data;
  g_variant_builder_init(&data, G_VARIANT_TYPE_VARDICT);
  if (!activationToken.empty() && g_utf8_validate(activationToken.c_str(), -1, nullptr))
    for (const char* name : {"activation-token", "desktop-startup-id"})
      g_variant_builder_add(&data, "{sv}", name, g_variant_new_string(activationToken.c_str()));
  return g_variant_builder_end(&data);
}

bool lists(GDesktopAppInfo* application, const std::string& action) {
  for (const char* const* each = g_desktop_app_info_list_actions(application); *each; ++each)
    if (action == *each) return true;
  return false;
}

BusMessage activation(const ApplicationLaunch& launch, bool hasAction) {
  const std::string& name = launch.desktopEntry;
  BusMessage message(g_dbus_message_new_method_call(name.c_str(), pathOf(name).c_str(), interface,
                                                    hasAction ? "ActivateAction" : "Activate"));
  GVariant* const data = platformData(launch.activationToken);
  g_dbus_message_set_body(message.get(), hasAction
                                             ? g_variant_new("(s@av@a{sv})", launch.action.c_str(),
                                                             g_variant_new("av", nullptr), data)
                                             : g_variant_new("(@a{sv})", data));
  return message;
}

// By the Exec line. It is read from an entry without its file's name, of which GIO would make a
// name on the bus.
Failure spawn(GDesktopAppInfo* application, const ApplicationLaunch& launch, bool hasAction) {
  const Context context(g_app_launch_context_new());
  for (const char* name : {"DESKTOP_STARTUP_ID", "XDG_ACTIVATION_TOKEN"}) {
    g_app_launch_context_unsetenv(context.get(), name);
    if (!launch.activationToken.empty())
      g_app_launch_context_setenv(context.get(), name, launch.activationToken.c_str());
  }
  // What the bus tells a program that it has started, and which the application is not.
  for (const char* name : {"DBUS_STARTER_ADDRESS", "DBUS_STARTER_BUS_TYPE"})
    g_app_launch_context_unsetenv(context.get(), name);
  if (hasAction) {
    g_desktop_app_info_launch_action(application, launch.action.c_str(), context.get());
    return std::nullopt;
  }
  GError* error = nullptr;
  if (g_app_info_launch(G_APP_INFO(application), nullptr, context.get(), &error))
    return std::nullopt;
  Failure failure = failureOf(error->message);
  g_error_free(error);
  return failure;
}

class DesktopLauncher final : public ApplicationLauncher {
 public:
  explicit DesktopLauncher(std::shared_ptr<SessionBus> bus) : bus_(std::move(bus)) {}

  void launch(const ApplicationLaunch& launch, Answer answer) override {
    const DesktopEntry entry = findDesktopEntry(launch.desktopEntry);
    const auto application = std::make_shared<Application>(
        entry ? g_desktop_app_info_new_from_keyfile(entry.get()) : nullptr);
    if (!*application)
      return answer(failureOf("No application \"" + launch.desktopEntry + "\" is installed."));
    const bool hasAction = lists(application->get(), launch.action);
    const bool isActivatable =
        g_desktop_app_info_get_boolean(application->get(), "DBusActivatable") &&
        g_dbus_is_name(launch.desktopEntry.c_str()) &&
        !g_dbus_is_unique_name(launch.desktopEntry.c_str());
    if (!isActivatable) return answer(spawn(application->get(), launch, hasAction));
    bus_->ask(activation(launch, hasAction), SessionBus::usualTime,
              [application, launch, hasAction, answer = std::move(answer)](
                  GDBusMessage*, const BusFailure& failure) {
                if (failure.isNobodyThere())
                  return answer(spawn(application->get(), launch, hasAction));
                answer(failure.text.empty() ? Failure() : failureOf(failure.text));
              });
  }

 private:
  const std::shared_ptr<SessionBus> bus_;
};

}  // namespace

std::unique_ptr<ApplicationLauncher> makeApplicationLauncher(std::shared_ptr<SessionBus> bus) {
  return std::make_unique<DesktopLauncher>(std::move(bus));
}

}  // namespace Varnel::Platform::Linux
