// SPDX-License-Identifier: MIT
#pragma once

#include <Varnel/Platform/Api.h>
#include <Varnel/Platform/Values/URL.h>

namespace Gtk {
class Widget;
}

namespace Varnel::GTK3 {

/// Lets the desktop open a file, a folder or a page with the application that the user prefers, and
/// returns at once. What goes wrong is told in a dialog above the widget's window. Main thread
/// only.
VARNEL_API void openURL(Gtk::Widget& widget, const Platform::URL& url);

}  // namespace Varnel::GTK3
