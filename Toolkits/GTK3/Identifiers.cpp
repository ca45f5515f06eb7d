// SPDX-License-Identifier: MIT
#include <Varnel/GTK3/Identifiers.h>
#include <gtkmm/button.h>
#include <gtkmm/menuitem.h>
#include <gtkmm/widget.h>

namespace Varnel::GTK3 {

void identify(Gtk::Widget& widget, const std::string& identifier) {
  atk_object_set_accessible_id(gtk_widget_get_accessible(widget.gobj()), identifier.c_str());
}

void identify(Gtk::Widget& widget, const MenuItemGroup::Item& item) {
  identify(widget, item());
}

void identify(Gtk::Button& button, const AccessibleAction& action) {
  identify(button, action.buttonIdentifier());
}

void identify(Gtk::MenuItem& item, const AccessibleAction& action) {
  identify(item, action.menuItemIdentifier());
}

std::string identifierOf(const Gtk::Widget& widget) {
  AtkObject* accessible = gtk_widget_get_accessible(const_cast<GtkWidget*>(widget.gobj()));
  const char* identifier = atk_object_get_accessible_id(accessible);
  return identifier ? identifier : "";
}

}  // namespace Varnel::GTK3
