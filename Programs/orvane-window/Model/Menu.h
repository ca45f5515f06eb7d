// SPDX-License-Identifier: MIT
#pragma once

#include <string>
#include <vector>

#include <Varnel/Context/UserFeatures.h>

namespace Orvane {

/// An item of the main menu that has a meaning here.
struct MenuEntry {
  std::string identifier;  ///< Of the catalogue.
  std::string textKey;
  std::string action;       ///< "win.scan"; of a submenu empty.
  std::string accelerator;  ///< As GTK writes it; often empty.
  bool startsSection = false;
  std::vector<MenuEntry> submenu{};
};

/// One menu of the main menu, with at least one item.
struct MenuGroup {
  std::string identifier;
  std::string textKey;  ///< Empty for the application's own menu, which bears its name.
  std::vector<MenuEntry> entries;
};

/// What there is to choose from: what a build or its channel lacks is absent, not disabled.
struct MenuFacts {
  Varnel::UserFeatures features;
  bool isDebugMode = false;
};

/// The main menu, in the catalogue's order.
[[nodiscard]] std::vector<MenuGroup> mainMenu(const MenuFacts& facts);

}  // namespace Orvane
