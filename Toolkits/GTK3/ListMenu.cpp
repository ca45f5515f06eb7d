// SPDX-License-Identifier: MIT
#include <Varnel/GTK3/ListMenu.h>
#include <gtkmm/menu.h>
#include <gtkmm/scrolledwindow.h>
#include <gtkmm/viewport.h>

#include <utility>

namespace Varnel::GTK3 {
namespace {

constexpr const char* key = "varnel-list-menu";

}  // namespace

void setListMenu(Gtk::Widget& list, ListMenu menu) {
  g_object_set_data_full(G_OBJECT(list.gobj()), key, new ListMenu(std::move(menu)),
                         [](gpointer kept) { delete static_cast<ListMenu*>(kept); });
}

Gtk::Menu* enclosingListMenu(const Gtk::Widget& widget, const CommonPathControl& control) {
  const auto* scrolled =
      dynamic_cast<const Gtk::ScrolledWindow*>(widget.get_ancestor(GTK_TYPE_SCROLLED_WINDOW));
  const Gtk::Widget* list = scrolled ? scrolled->get_child() : nullptr;
  // What cannot scroll by itself is wrapped.
  if (const auto* viewport = dynamic_cast<const Gtk::Viewport*>(list)) list = viewport->get_child();
  if (!list) return nullptr;
  const auto* menu = static_cast<const ListMenu*>(
      g_object_get_data(G_OBJECT(const_cast<GtkWidget*>(list->gobj())), key));
  return menu && *menu ? (*menu)(control) : nullptr;
}

}  // namespace Varnel::GTK3
