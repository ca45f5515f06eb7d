// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <string>

#include <Varnel/Platform/Api.h>

namespace Gtk {
class Window;
}

namespace Varnel::GTK3 {

/// Shows a window in front of those of other applications, with the right to do so that a click on
/// a notification has given:
///
///     router.register_(identifier, [&](const auto& notification, auto kind) {
///       if (kind != EventKind::didDeliver) bringToFront(window, notification.activationToken);
///     });
///
/// Without a token the desktop may only mark the window as wanting attention. Main thread only.
VARNEL_API void bringToFront(Gtk::Window& window,
                             const std::optional<std::string>& activationToken = std::nullopt);

}  // namespace Varnel::GTK3
