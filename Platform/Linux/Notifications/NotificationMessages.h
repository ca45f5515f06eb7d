// SPDX-License-Identifier: MIT
#pragma once

#include <gio/gio.h>

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

#include <Varnel/Platform/Linux/Notifications/BusNotificationServer.h>
#include <Varnel/Platform/Ports/NotificationServer.h>
#include <Varnel/Platform/Values/NotificationSource.h>
#include <Varnel/Platform/Values/UniqueHandle.h>

/// The messages of the desktop's notification service, as it is specified for all desktops.
namespace Varnel::Platform::Linux {

using BusMessage = UniqueHandle<GDBusMessage*, g_object_unref>;

inline constexpr const char* notificationPath = "/org/freedesktop/Notifications";

/// The actions that banners offer.
inline constexpr const char* defaultAction = "default";
inline constexpr const char* buttonAction = "action";
inline constexpr const char* dismissAction = "dismiss";

/// The reason of a closed banner that means: the user closed it.
inline constexpr std::uint32_t dismissedByUser = 2;
/// Its time was over; the server may still keep it in a list.
inline constexpr std::uint32_t expired = 1;

/// The capabilities of a server that matter here.
struct ServerCapabilities final {
  bool hasActions = false;
  bool readsMarkup = false;
};

/// A banner as the bus knows it: the bus's own name, that of the server on it, and its number.
struct BannerAddress final {
  std::string bus;
  std::string server;
  std::uint32_t number = 0;

  bool operator==(const BannerAddress&) const = default;

  [[nodiscard]] std::string reference() const;
  [[nodiscard]] static std::optional<BannerAddress> parse(const std::string& reference);
};

[[nodiscard]] BusMessage capabilitiesRequest();
[[nodiscard]] ServerCapabilities capabilitiesIn(GDBusMessage* reply);

/// `replaced` is the number of the banner to replace, or 0.
[[nodiscard]] BusMessage notifyRequest(const std::string& server, const NotificationSource& source,
                                       const Banner& banner, ServerCapabilities capabilities,
                                       std::uint32_t replaced);
[[nodiscard]] std::optional<std::uint32_t> bannerNumberIn(GDBusMessage* reply);

/// What the server tells of a banner.
struct BannerSignal final {
  enum class Kind { invoked, token, closed };

  Kind kind = Kind::closed;
  std::uint32_t number = 0;
  std::string text = {};     ///< The action, or the token with which a window comes to the front.
  std::uint32_t reason = 0;  ///< Why it was closed.
};

/// Absent for a signal that tells nothing of a banner, or not as is specified.
[[nodiscard]] std::optional<BannerSignal> bannerSignalIn(std::string_view name, GVariant* body);

[[nodiscard]] BusMessage closeRequest(const BannerAddress& banner);

/// A call of the bus itself.
[[nodiscard]] BusMessage messageToBus(const char* method, GVariant* body);
/// Asks the bus for nothing but an answer.
[[nodiscard]] BusMessage pingOfBus();
/// Whether the reply is a yes.
[[nodiscard]] bool isYes(GDBusMessage* reply);

/// The error that a reply reports.
[[nodiscard]] std::optional<std::string> errorIn(GDBusMessage* reply);

}  // namespace Varnel::Platform::Linux
