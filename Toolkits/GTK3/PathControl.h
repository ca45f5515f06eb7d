// SPDX-License-Identifier: MIT
#pragma once

#include <gtkmm/drawingarea.h>

#include <functional>
#include <memory>

#include <Varnel/GTK3/DisplayTexts.h>
#include <Varnel/GTK3/PathCell.h>
#include <Varnel/Paths/CommonPathControl.h>
#include <Varnel/Platform/Api.h>
#include <Varnel/Platform/Values/URL.h>

namespace Varnel::GTK3 {

/// A widget that shows a path as a row of components with icons, for a row of a list that has a
/// widget for each row. A single click goes through to the list, which selects the row; a double
/// click opens the component; a right click shows the menu of the list (`setListMenu`).
/// `PathColumn` does the same for lists that have a model.
///
///     PathControl path;
///     path.setURL(folder, PathKind::folder);
///     path.setOpen([this](const Platform::URL& url) { show(url); });
///
/// On the accessibility bus its name is the path's short form. Main thread only.
class VARNEL_API PathControl final : public Gtk::DrawingArea {
 public:
  using Open = std::function<void(const Platform::URL& url)>;

  PathControl();
  ~PathControl() override;

  void setURL(const Platform::URL& url, PathKind kind = PathKind::file);

  /// What a double click on a component does; unless set, the desktop opens it (`openURL`).
  void setOpen(Open open);

  [[nodiscard]] CommonPathControl& control();

 protected:
  Gtk::SizeRequestMode get_request_mode_vfunc() const override;
  void get_preferred_width_vfunc(int& minimum, int& natural) const override;
  void get_preferred_height_vfunc(int& minimum, int& natural) const override;
  bool on_draw(const Cairo::RefPtr<Cairo::Context>& context) override;
  bool on_button_press_event(GdkEventButton* event) override;

 private:
  class View;

  mutable PathCell cell_;
  const std::unique_ptr<View> view_;
};

}  // namespace Varnel::GTK3
