// SPDX-License-Identifier: MIT
#include <Varnel/GTK3/ErrorDialog.h>
#include <Varnel/GTK3/OpenURL.h>
#include <Varnel/Logging/UserErrorInfo.h>
#include <gtkmm/window.h>

namespace Varnel::GTK3 {

void openURL(Gtk::Widget& widget, const Platform::URL& url) {
  auto* window = dynamic_cast<Gtk::Window*>(widget.get_toplevel());
  GError* error = nullptr;
  if (gtk_show_uri_on_window(window ? window->gobj() : nullptr, url.absoluteString().c_str(),
                             gtk_get_current_event_time(), &error))
    return;
  if (window) presentError(*window, UserErrorInfo(error->message, ""));
  g_error_free(error);
}

}  // namespace Varnel::GTK3
