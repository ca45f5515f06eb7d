// SPDX-License-Identifier: MIT
#include <Varnel/GTK3/Identifiers.h>
#include <Varnel/GTK3/Menus.h>
#include <glibmm/main.h>
#include <gtkmm/accellabel.h>
#include <gtkmm/application.h>
#include <gtkmm/checkmenuitem.h>
#include <gtkmm/menu.h>
#include <gtkmm/separatormenuitem.h>
#include <sigc++/sigc++.h>

#include <algorithm>

namespace Varnel::GTK3 {
namespace {

// Through the accessibility bus an item may be chosen in a menu that is not shown. GTK cannot show
// the item's own menu beside it then, and yet both take the pointer and the keys, for good.
void releaseUnshown(Gtk::MenuItem& item, Gtk::Menu& submenu) {
  const auto release = [&item, &submenu] {
    submenu.cancel();
    if (auto* menu = dynamic_cast<Gtk::MenuShell*>(item.get_parent())) menu->cancel();
    return false;
  };
  item.signal_select().connect([&item, &submenu, release] {
    if (!item.get_mapped())
      Glib::signal_idle().connect(sigc::track_obj(release, item, submenu), Glib::PRIORITY_HIGH);
  });
}

Gtk::MenuItem* makeItem(const MenuEntry& entry, Gtk::Application& application) {
  Gtk::MenuItem* item = entry.kind == MenuItemKind::toggle
                            ? Gtk::make_managed<Gtk::CheckMenuItem>(entry.title, true)
                            : Gtk::make_managed<Gtk::MenuItem>(entry.title, true);
  identify(*item, entry.identifier);
  if (!entry.submenu.empty()) {
    auto* menu = Gtk::make_managed<Gtk::Menu>();
    appendSections(*menu, application, entry.submenu);
    item->set_submenu(*menu);
    releaseUnshown(*item, *menu);
    return item;
  }
  gtk_actionable_set_detailed_action_name(GTK_ACTIONABLE(item->gobj()), entry.action.c_str());
  if (auto* label = dynamic_cast<Gtk::AccelLabel*>(item->get_child());
      label && !entry.accelerators.empty()) {
    const Gtk::AccelKey key(entry.accelerators.front());
    label->set_accel(key.get_key(), key.get_mod());
  }
  return item;
}

}  // namespace

void appendSections(Gtk::MenuShell& menu, Gtk::Application& application,
                    const std::vector<MenuSection>& sections) {
  for (const MenuSection& section : sections) {
    if (!section.empty() && !menu.get_children().empty())
      menu.append(*Gtk::make_managed<Gtk::SeparatorMenuItem>());
    for (const MenuEntry& entry : section) {
      menu.append(*makeItem(entry, application));
      if (!entry.accelerators.empty())
        application.set_accels_for_action(entry.action,
                                          {entry.accelerators.begin(), entry.accelerators.end()});
    }
  }
  menu.show_all();
}

void appendMenus(Gtk::MenuShell& bar, Gtk::Application& application,
                 const std::vector<MenuDescription>& menus) {
  for (const MenuDescription& description : menus) {
    if (std::ranges::all_of(description.sections, &MenuSection::empty)) continue;
    auto* menu = Gtk::make_managed<Gtk::Menu>();
    appendSections(*menu, application, description.sections);
    auto* title = Gtk::make_managed<Gtk::MenuItem>(description.title, true);
    identify(*title, description.identifier);
    title->set_submenu(*menu);
    bar.append(*title);
  }
  bar.show_all();
}

}  // namespace Varnel::GTK3
