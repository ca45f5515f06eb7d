// SPDX-License-Identifier: MIT
#include <orvane-window/Interface/MainMenu.h>

#include <gtkmm/accellabel.h>
#include <gtkmm/menu.h>
#include <gtkmm/menuitem.h>
#include <gtkmm/separatormenuitem.h>

#include <Varnel/Context/Globals.h>
#include <Varnel/GTK3/Identifiers.h>
#include <orvane-window/Interface/SetAction.h>
#include <orvane-window/Model/Texts.h>

namespace Orvane {

using Varnel::GTK3::identify;
namespace {

void showAccelerator(Gtk::MenuItem& item, const std::string& accelerator) {
  guint key = 0;
  GdkModifierType modifiers{};
  gtk_accelerator_parse(accelerator.c_str(), &key, &modifiers);
  if (auto* label = dynamic_cast<Gtk::AccelLabel*>(item.get_child()); label && key != 0)
    label->set_accel(key, static_cast<Gdk::ModifierType>(modifiers));
}

}  // namespace

void fillMenu(Gtk::Menu& menu, const std::vector<MenuEntry>& entries) {
  for (const MenuEntry& entry : entries) {
    if (entry.startsSection) menu.append(*Gtk::manage(new Gtk::SeparatorMenuItem));
    auto* item = Gtk::manage(new Gtk::MenuItem(localized(entry.textKey)));
    identify(*item, entry.identifier);
    if (entry.submenu.empty()) {
      setAction(*item, entry.action);
      showAccelerator(*item, entry.accelerator);
    } else {
      auto* submenu = Gtk::manage(new Gtk::Menu);
      fillMenu(*submenu, entry.submenu);
      item->set_submenu(*submenu);
    }
    menu.append(*item);
  }
  menu.show_all();
}

void fillMenuBar(Gtk::MenuBar& bar, const std::vector<MenuGroup>& groups) {
  for (const MenuGroup& group : groups) {
    const std::string title =
        group.textKey.empty() ? Varnel::Globals::applicationName() : localized(group.textKey);
    auto* item = Gtk::manage(new Gtk::MenuItem(title, true));
    identify(*item, group.identifier);
    auto* menu = Gtk::manage(new Gtk::Menu);
    fillMenu(*menu, group.entries);
    item->set_submenu(*menu);
    bar.append(*item);
  }
  bar.show_all();
}

}  // namespace Orvane
