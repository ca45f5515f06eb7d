// SPDX-License-Identifier: MIT
#pragma once

#include <gtk/gtk.h>
#include <gtkmm/widget.h>

#include <string>

namespace Orvane {

/// Gives a widget the identifier by which interface automation finds it.
inline void identify(Gtk::Widget& widget, const std::string& identifier) {
  atk_object_set_accessible_id(gtk_widget_get_accessible(widget.gobj()), identifier.c_str());
}

/// Lets a click do an action of the window or the application ("win.scan"), and be as sensitive.
inline void setAction(Gtk::Widget& widget, const std::string& detailedName) {
  gtk_actionable_set_detailed_action_name(GTK_ACTIONABLE(widget.gobj()), detailedName.c_str());
}

}  // namespace Orvane
