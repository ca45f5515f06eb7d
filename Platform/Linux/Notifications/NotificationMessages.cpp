// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Linux/Notifications/NotificationMessages.h>

#include <array>
#include <charconv>

namespace Varnel::Platform::Linux {
namespace {

using Text = UniqueHandle<char*, g_free>;

constexpr gint32 expiryOfServer = -1;
// No general category fits, so it is one of the suite's own, as the service's rules for them say.
constexpr const char* category = "x-quennel.reminder";
constexpr guchar normalUrgency = 1;

BusMessage request(const char* destination, const char* method, GVariant* body) {
  BusMessage message(
      g_dbus_message_new_method_call(destination, notificationPath, notificationService, method));
  if (body) g_dbus_message_set_body(message.get(), body);
  return message;
}

// The bus carries valid UTF-8 only.
Text valid(const std::string& text) {
  return Text(g_utf8_make_valid(text.data(), static_cast<gssize>(text.size())));
}

// The bus takes a name or a URI.
Text iconOf(const NotificationSource& source) {
  if (source.icon.starts_with('/'))
    if (Text uri(g_filename_to_uri(source.icon.c_str(), nullptr, nullptr)); uri) return uri;
  return valid(source.icon);
}

GVariant* hintsOf(const NotificationSource& source) {
  GVariantBuilder hints;
  g_variant_builder_init(&hints, G_VARIANT_TYPE("a{sv}"));
  if (!source.desktopEntry.empty())
    g_variant_builder_add(&hints, "{sv}", "desktop-entry",
                          g_variant_new_string(valid(source.desktopEntry).get()));
  g_variant_builder_add(&hints, "{sv}", "category", g_variant_new_string(category));
  g_variant_builder_add(&hints, "{sv}", "urgency", g_variant_new_byte(normalUrgency));
  return g_variant_builder_end(&hints);
}

GVariant* actionsOf(const Banner& banner, ServerCapabilities capabilities) {
  GVariantBuilder actions;
  g_variant_builder_init(&actions, G_VARIANT_TYPE("as"));
  const auto add = [&](const char* name, const std::string& title) {
    g_variant_builder_add(&actions, "s", name);
    g_variant_builder_add(&actions, "s", valid(title).get());
  };
  if (capabilities.hasActions) {
    add(defaultAction, banner.actionTitle);
    if (!banner.actionTitle.empty()) add(buttonAction, banner.actionTitle);
    if (!banner.dismissTitle.empty()) add(dismissAction, banner.dismissTitle);
  }
  return g_variant_builder_end(&actions);
}

}  // namespace

std::string BannerAddress::reference() const {
  return bus + " " + server + " " + std::to_string(number);
}

std::optional<BannerAddress> BannerAddress::parse(const std::string& reference) {
  const std::size_t first = reference.find(' ');
  const std::size_t second = reference.find(' ', first + 1);
  if (first == std::string::npos || second == std::string::npos) return std::nullopt;
  BannerAddress address{.bus = reference.substr(0, first),
                        .server = reference.substr(first + 1, second - first - 1)};
  const char* end = reference.data() + reference.size();
  const auto [stop, error] =
      std::from_chars(reference.data() + second + 1, end, address.number, 10);
  if (error != std::errc() || stop != end || !g_dbus_is_unique_name(address.server.c_str()))
    return std::nullopt;
  return address;
}

BusMessage capabilitiesRequest() {
  return request(notificationService, "GetCapabilities", nullptr);
}

ServerCapabilities capabilitiesIn(GDBusMessage* reply) {
  ServerCapabilities capabilities;
  GVariant* body = g_dbus_message_get_body(reply);
  if (!body || !g_variant_is_of_type(body, G_VARIANT_TYPE("(as)"))) return capabilities;
  GVariantIter* names = nullptr;
  const char* name = nullptr;
  g_variant_get(body, "(as)", &names);
  while (g_variant_iter_loop(names, "&s", &name)) {
    if (std::string_view(name) == "actions") capabilities.hasActions = true;
    if (std::string_view(name) == "body-markup") capabilities.readsMarkup = true;
  }
  g_variant_iter_free(names);
  return capabilities;
}

BusMessage notifyRequest(const std::string& server, const NotificationSource& source,
                         const Banner& banner, ServerCapabilities capabilities,
                         std::uint32_t replaced) {
  Text text = valid(banner.text);
  if (capabilities.readsMarkup) text = Text(g_markup_escape_text(text.get(), -1));
  GVariant* body = g_variant_new("(susss@as@a{sv}i)", valid(source.name).get(), replaced,
                                 iconOf(source).get(), valid(banner.title).get(), text.get(),
                                 actionsOf(banner, capabilities), hintsOf(source), expiryOfServer);
  return request(server.c_str(), "Notify", body);
}

std::optional<std::uint32_t> bannerNumberIn(GDBusMessage* reply) {
  GVariant* body = g_dbus_message_get_body(reply);
  if (!body || !g_variant_is_of_type(body, G_VARIANT_TYPE("(u)"))) return std::nullopt;
  guint32 number = 0;
  g_variant_get(body, "(u)", &number);
  return number;
}

std::optional<BannerSignal> bannerSignalIn(std::string_view name, GVariant* body) {
  using enum BannerSignal::Kind;
  BannerSignal signal{.kind = name == "ActionInvoked"     ? invoked
                              : name == "ActivationToken" ? token
                                                          : closed};
  if (signal.kind == closed) {
    if (name != "NotificationClosed" || !g_variant_is_of_type(body, G_VARIANT_TYPE("(uu)")))
      return std::nullopt;
    g_variant_get(body, "(uu)", &signal.number, &signal.reason);
    return signal;
  }
  if (!g_variant_is_of_type(body, G_VARIANT_TYPE("(us)"))) return std::nullopt;
  const char* text = nullptr;
  g_variant_get(body, "(u&s)", &signal.number, &text);
  signal.text = text;
  return signal;
}

BusMessage closeRequest(const BannerAddress& banner) {
  return request(banner.server.c_str(), "CloseNotification",
                 g_variant_new("(u)", guint32{banner.number}));
}

BusMessage messageToBus(const char* method, GVariant* body) {
  constexpr const char* bus = "org.freedesktop.DBus";
  BusMessage message(g_dbus_message_new_method_call(bus, "/org/freedesktop/DBus", bus, method));
  g_dbus_message_set_body(message.get(), body);
  return message;
}

bool isYes(GDBusMessage* reply) {
  GVariant* body = g_dbus_message_get_body(reply);
  gboolean answer = FALSE;
  if (body && g_variant_is_of_type(body, G_VARIANT_TYPE("(b)")))
    g_variant_get(body, "(b)", &answer);
  return answer != FALSE;
}

BusMessage pingOfBus() {
  return BusMessage(g_dbus_message_new_method_call("org.freedesktop.DBus", "/org/freedesktop/DBus",
                                                   "org.freedesktop.DBus.Peer", "Ping"));
}

std::optional<std::string> errorIn(GDBusMessage* reply) {
  GError* error = nullptr;
  if (!g_dbus_message_to_gerror(reply, &error)) return std::nullopt;
  std::string text = error->message;
  g_error_free(error);
  return text;
}

}  // namespace Varnel::Platform::Linux
