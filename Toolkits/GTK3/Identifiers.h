// SPDX-License-Identifier: MIT
#pragma once

#include <string>

#include <Varnel/Interface/AccessibleAction.h>
#include <Varnel/Interface/MenuItemGroup.h>
#include <Varnel/Platform/Api.h>

namespace Gtk {
class Button;
class MenuItem;
class Widget;
}  // namespace Gtk

namespace Varnel::GTK3 {

/// Gives a widget the identifier by which interface automation finds it on the accessibility bus,
/// whatever the language of the interface:
///
///     const AccessibleAction remove("remove");
///     identify(removeButton, remove);                                       // remove.button
///     identify(removeItem, remove);                                         // remove.menu-item
///     identify(copyItem, MainMenuAccessibility::instance().edit().actionCopy);
///     identify(progressBar, "scan-progress");
///
/// Of several calls for one widget the last one holds. Main thread only.
VARNEL_API void identify(Gtk::Widget& widget, const std::string& identifier);
VARNEL_API void identify(Gtk::Widget& widget, const MenuItemGroup::Item& item);
VARNEL_API void identify(Gtk::Button& button, const AccessibleAction& action);
VARNEL_API void identify(Gtk::MenuItem& item, const AccessibleAction& action);

/// The identifier of a widget; empty if it has none.
[[nodiscard]] VARNEL_API std::string identifierOf(const Gtk::Widget& widget);

}  // namespace Varnel::GTK3
