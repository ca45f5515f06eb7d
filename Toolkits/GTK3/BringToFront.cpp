// SPDX-License-Identifier: MIT
#include <Varnel/GTK3/BringToFront.h>
#include <gtkmm/window.h>

namespace Varnel::GTK3 {

void bringToFront(Gtk::Window& window, const std::optional<std::string>& activationToken) {
  if (activationToken) window.set_startup_id(*activationToken);
  window.present();
}

}  // namespace Varnel::GTK3
