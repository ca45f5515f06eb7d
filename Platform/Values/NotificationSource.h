// SPDX-License-Identifier: MIT
#pragma once

#include <string>

namespace Varnel::Platform {

/// The product that notifications come from, as its notification center keeps it and as the desktop
/// shows it to the user.
///
///     const NotificationSource fotovia{.identifier = "com.example.Fotovia",
///                                      .name = "Fotovia 3",
///                                      .desktopEntry = "com.example.Fotovia",
///                                      .icon = "fotovia"};
///
/// Texts are UTF-8; all but the identifier may be empty. A plain value.
struct NotificationSource final {
  std::string identifier = {};    ///< The base identifier, which no other product has.
  std::string name = {};          ///< As the user knows the application.
  std::string desktopEntry = {};  ///< Of the application, without its suffix.
  std::string icon = {};          ///< The name of one in the user's theme, or the path of a file.

  bool operator==(const NotificationSource&) const = default;
};

}  // namespace Varnel::Platform
