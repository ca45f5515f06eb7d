// SPDX-License-Identifier: MIT
#pragma once

#include <string>
#include <vector>

#include <Varnel/Platform/Api.h>

namespace Gtk {
class Application;
class MenuShell;
}  // namespace Gtk

namespace Varnel::GTK3 {

/// What a menu item looks like.
enum class MenuItemKind {
  command,
  toggle,  ///< With a check mark while the state of its action is true.
};

/// One item of a menu, bound to an action of the application ("app.…") or of its windows ("win.…").
struct MenuEntry {
  std::string identifier;  ///< For interface automation: an item of the catalogue.
  std::string title;       ///< In the user's language; "_" stands before the mnemonic.
  std::string action;
  std::vector<std::string> accelerators = {};  ///< As "<Primary>q"; the item shows the first.
  MenuItemKind kind = MenuItemKind::command;
  /// Sections of a menu of its own, in place of the action.
  std::vector<std::vector<MenuEntry>> submenu = {};
};

/// Items between two separators.
using MenuSection = std::vector<MenuEntry>;

/// One menu of a menu bar.
struct MenuDescription {
  std::string identifier;
  std::string title;
  std::vector<MenuSection> sections;
};

/// Fills a menu bar, and gives the actions their accelerators. What has no meaning is not
/// described: a menu without items is left out, and so is a section, with its separator.
///
///     const auto& menu = MainMenuAccessibility::instance();
///     Gtk::MenuBar bar;
///     appendMenus(bar, application,
///                 {{menu.edit().baseIdentifier(), _("_Edit"),
///                   {{{menu.edit().actionCopy(), _("_Copy"), "win.copy", {"<Primary>c"}}},
///                    {{menu.edit().selectAll(), _("Select _All"), "win.select-all"}}}}});
///
/// An item is sensitive while its action is there and enabled. Main thread only.
VARNEL_API void appendMenus(Gtk::MenuShell& bar, Gtk::Application& application,
                            const std::vector<MenuDescription>& menus);

/// Fills one menu, as that of a list, in the same way.
VARNEL_API void appendSections(Gtk::MenuShell& menu, Gtk::Application& application,
                               const std::vector<MenuSection>& sections);

}  // namespace Varnel::GTK3
