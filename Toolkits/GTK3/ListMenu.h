// SPDX-License-Identifier: MIT
#pragma once

#include <functional>

#include <Varnel/Platform/Api.h>

namespace Gtk {
class Menu;
class Widget;
}  // namespace Gtk

namespace Varnel {
class CommonPathControl;
}

namespace Varnel::GTK3 {

/// Gives the menu of a list for a right click. It may ask the control which component of its path
/// was clicked; that is null beside the path, and for the menu key. Null for no menu.
using ListMenu = std::function<Gtk::Menu*(const CommonPathControl& control)>;

/// Sets the menu of a list: of the widget inside a scrolled window that has path controls
/// (`PathControl`, `PathColumn`) in its rows. They show it on a right click.
///
///     setListMenu(treeView, [this](const CommonPathControl& control) {
///       revealItem.set_sensitive(control.rightClickedPathComponentCell() != nullptr);
///       return &menu;
///     });
///
/// The menu lives on; the list keeps the function as long as it lives. Main thread only.
VARNEL_API void setListMenu(Gtk::Widget& list, ListMenu menu);

/// The menu of the list in the scrolled window that encloses a widget; null without one of them.
[[nodiscard]] VARNEL_API Gtk::Menu* enclosingListMenu(const Gtk::Widget& widget,
                                                      const CommonPathControl& control);

}  // namespace Varnel::GTK3
