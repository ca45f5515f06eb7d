// SPDX-License-Identifier: MIT
// What the notification server, the notifier and the hosts say on the session bus: a line with the
// name of the message, and the text of its body.
#include <Fuzz/Fuzz.h>
#include <Varnel/Platform/Linux/Notifications/NotificationMessages.h>
#include <Varnel/Platform/Linux/Notifications/NotifierProtocol.h>

using namespace Varnel::Platform;
using namespace Varnel::Platform::Linux;
using Variant = UniqueHandle<GVariant*, g_variant_unref>;

static void readReply(GVariant* body) {
  const BusMessage reply(g_dbus_message_new_signal("/", "org.example.Interface", "Signal"));
  g_dbus_message_set_body(reply.get(), body);
  static_cast<void>(capabilitiesIn(reply.get()));
  static_cast<void>(bannerNumberIn(reply.get()));
  static_cast<void>(isYes(reply.get()));
  g_dbus_message_set_message_type(reply.get(), G_DBUS_MESSAGE_TYPE_ERROR);
  g_dbus_message_set_error_name(reply.get(), "org.example.Error");
  require(errorIn(reply.get()).has_value());
}

static void readCall(GVariant* arguments) {
  // The bus lets no other arguments through.
  if (g_variant_is_of_type(arguments, G_VARIANT_TYPE("(ay)")))
    static_cast<void>(storeIn(arguments));
  const bool isClick = g_variant_is_of_type(arguments, G_VARIANT_TYPE("(a{sv}b)"));
  if (!isClick && !g_variant_is_of_type(arguments, G_VARIANT_TYPE("(a{sv})"))) return;
  const NotificationActivation activation = activationIn(arguments);
  const Variant sent(g_variant_ref_sink(variantOf(activation.notification)));
  require(notificationIn(sent.get()) == activation.notification);
}

static void fuzz(std::string_view input) {
  const auto [name, text] = cutAt('\n', input);
  if (const auto banner = BannerAddress::parse(std::string(name)))
    require(BannerAddress::parse(banner->reference()) == banner);
  const Variant body(
      g_variant_parse(nullptr, text.data(), text.data() + text.size(), nullptr, nullptr));
  if (!body || !g_variant_is_of_type(body.get(), G_VARIANT_TYPE_TUPLE)) return;
  readReply(body.get());
  readCall(body.get());
  static_cast<void>(bannerSignalIn(name, body.get()));
}
