// SPDX-License-Identifier: MIT
#pragma once

#include <gtkmm/accelgroup.h>
#include <gtkmm/menubar.h>

#include <vector>

#include <orvane-window/Model/Menu.h>

namespace Orvane {

/// Fills the bar with the menus. Their items call the actions of the window and the application,
/// and are as sensitive as those. The application knows the accelerators: see `setAccelerators`.
void fillMenuBar(Gtk::MenuBar& bar, const std::vector<MenuGroup>& groups);

/// Fills a menu with entries.
void fillMenu(Gtk::Menu& menu, const std::vector<MenuEntry>& entries);

}  // namespace Orvane
