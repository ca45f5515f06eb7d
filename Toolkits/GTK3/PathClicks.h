// SPDX-License-Identifier: MIT
#pragma once

#include <gtkmm/menu.h>
#include <gtkmm/widget.h>

#include <functional>
#include <memory>
#include <utility>

#include <Varnel/GTK3/ListMenu.h>
#include <Varnel/GTK3/OpenURL.h>
#include <Varnel/Paths/CommonPathControl.h>

namespace Varnel::GTK3 {

/// What the mouse does to a path in a widget: the common part of `PathControl` and `PathColumn`.
/// Locations are those of the widget. Main thread only.
class PathClicks : public CommonPathControl::View {
 public:
  using Open = std::function<void(const Platform::URL& url)>;

  explicit PathClicks(Gtk::Widget& widget)
      : widget_(widget), open_([&widget](const Platform::URL& url) { openURL(widget, url); }) {}

  /// False for what the list is to handle.
  bool press(const GdkEventButton& event, CommonPathControl::Point location) {
    if (gdk_event_triggers_context_menu(reinterpret_cast<const GdkEvent*>(&event)))
      return showMenu(&event, {1, location});
    if (event.button != GDK_BUTTON_PRIMARY) return false;
    isHandled_ = false;
    control_.mouseDown({clickCount(event), location});
    return isHandled_;
  }

  /// Shows the menu of the list; with the menu key, which clicks no component, without an event.
  bool showMenu(const GdkEventButton* event, const CommonPathControl::MouseEvent& click) {
    const auto menu = std::dynamic_pointer_cast<ShownMenu>(control_.menu(click));
    if (!menu) return false;
    if (event)
      gtk_menu_popup_at_pointer(menu->menu.gobj(), reinterpret_cast<const GdkEvent*>(event));
    else
      gtk_menu_popup_at_widget(menu->menu.gobj(), widget_.gobj(), GDK_GRAVITY_CENTER,
                               GDK_GRAVITY_NORTH_WEST, nullptr);
    return true;
  }

  void setOpen(Open open) { open_ = std::move(open); }
  [[nodiscard]] CommonPathControl& control() { return control_; }

 private:
  struct ShownMenu final : CommonPathControl::Menu {
    explicit ShownMenu(Gtk::Menu& shown) : menu(shown) {}
    Gtk::Menu& menu;
  };

  static int clickCount(const GdkEventButton& event) {
    return event.type == GDK_3BUTTON_PRESS ? 3 : event.type == GDK_2BUTTON_PRESS ? 2 : 1;
  }

  void nextResponderMouseDown(const CommonPathControl::MouseEvent&) override {}
  void pathControlMouseDown(const CommonPathControl::MouseEvent& event) override {
    const auto component = pathComponentCellAt(event.location);
    isHandled_ = component != nullptr;
    if (component && event.clickCount == 2 && open_) open_(component->url());
  }
  [[nodiscard]] CommonPathControl::Point convertedFromWindow(
      CommonPathControl::Point location) const override {
    return location;
  }
  [[nodiscard]] std::shared_ptr<CommonPathControl::Menu> documentViewMenu(
      const CommonPathControl::MouseEvent&) const override {
    Gtk::Menu* menu = enclosingListMenu(widget_, control_);
    return menu ? std::make_shared<ShownMenu>(*menu) : nullptr;
  }

  Gtk::Widget& widget_;
  Open open_;
  bool isHandled_ = false;
  CommonPathControl control_{*this};
};

}  // namespace Varnel::GTK3
