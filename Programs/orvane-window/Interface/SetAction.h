// SPDX-License-Identifier: MIT
#pragma once

#include <gtk/gtk.h>
#include <gtkmm/widget.h>

#include <string>

namespace Orvane {

/// Lets a click do an action of the window or the application ("win.scan"), and be as sensitive.
inline void setAction(Gtk::Widget& widget, const std::string& detailedName) {
  gtk_actionable_set_detailed_action_name(GTK_ACTIONABLE(widget.gobj()), detailedName.c_str());
}

}  // namespace Orvane
