// SPDX-License-Identifier: MIT
#include <Varnel/GTK3/PathClicks.h>
#include <Varnel/GTK3/PathColumn.h>
#include <gtkmm/treeview.h>
#include <sigc++/sigc++.h>

#include <utility>

namespace Varnel::GTK3 {

class PathColumn::View final : public PathClicks, public sigc::trackable {
 public:
  View(PathColumn& column, Gtk::TreeView& view, PathCell& cell)
      : PathClicks(view), column_(column), view_(view), cell_(cell) {
    // Ahead of the view, whose own handling would select another row for a right click.
    view.signal_button_press_event().connect(sigc::mem_fun(*this, &View::pressInView), false);
    view.signal_popup_menu().connect(sigc::mem_fun(*this, &View::popUp), false);
  }

 private:
  bool pressInView(GdkEventButton* event) {
    if (event->window != view_.get_bin_window()->gobj()) return false;
    if (gdk_event_triggers_context_menu(reinterpret_cast<const GdkEvent*>(event)))
      selectAt(static_cast<int>(event->x), static_cast<int>(event->y));
    // The second press of a double click would activate the row; the component opens instead.
    if (isFirstOfTwo(*event) && pathComponentCellAt({event->x, event->y})) return true;
    return press(*event, {event->x, event->y});
  }

  // GDK puts the double click right behind the press that makes it one.
  static bool isFirstOfTwo(const GdkEventButton& event) {
    if (event.type != GDK_BUTTON_PRESS || event.button != GDK_BUTTON_PRIMARY) return false;
    GdkEvent* next = gdk_event_peek();
    const bool is = next && next->type == GDK_2BUTTON_PRESS;
    if (next) gdk_event_free(next);
    return is;
  }

  bool popUp() {
    control().setRightClickedPathComponentCell(nullptr);
    return showMenu(nullptr, {1, {-1, -1}});
  }

  void selectAt(int x, int y) {
    Gtk::TreeModel::Path path;
    if (!view_.get_path_at_pos(x, y, path)) return;
    const auto selection = view_.get_selection();
    if (!selection->is_selected(path)) view_.set_cursor(path);
  }

  // Rows come and go, so the component is looked for in the row under the pointer.
  [[nodiscard]] bool hasPathCell() const override { return true; }
  [[nodiscard]] std::shared_ptr<CommonPathControl::PathComponentCell> pathComponentCellAt(
      CommonPathControl::Point location) const override {
    Gtk::TreeModel::Path path;
    Gtk::TreeViewColumn* column = nullptr;
    int x = 0;
    int y = 0;
    if (!view_.get_path_at_pos(static_cast<int>(location.x), static_cast<int>(location.y), path,
                               column, x, y) ||
        column != &column_)
      return nullptr;
    const auto row = view_.get_model()->get_iter(path);
    column_.cell_set_cell_data(view_.get_model(), row, false, false);
    int start = 0;
    int width = 0;
    if (!cell_.hasURL() || !column_.get_cell_position(cell_, start, width)) return nullptr;
    Gdk::Rectangle area;
    view_.get_cell_area(path, column_, area);
    const int indent = area.get_x() - (static_cast<int>(location.x) - x);
    return cell_.componentAt(view_, width, x - indent - start);
  }

  PathColumn& column_;
  Gtk::TreeView& view_;
  PathCell& cell_;
};

PathColumn::PathColumn(Gtk::TreeView& view, const Glib::ustring& title, LocationOf locationOf)
    : Gtk::TreeViewColumn(title), view_(std::make_unique<View>(*this, view, cell_)) {
  pack_start(cell_, true);
  set_cell_data_func(cell_, [this, locationOf = std::move(locationOf)](
                                Gtk::CellRenderer*, const Gtk::TreeModel::iterator& row) {
    const auto location = locationOf(row);
    cell_.property_visible() = location.has_value();
    if (location)
      cell_.setURL(location->url, location->kind);
    else
      cell_.setURL(std::nullopt);
  });
  set_expand();
  view.append_column(*this);
}

PathColumn::~PathColumn() = default;

void PathColumn::setOpen(Open open) {
  view_->setOpen(std::move(open));
}

CommonPathControl& PathColumn::control() {
  return view_->control();
}

}  // namespace Varnel::GTK3
