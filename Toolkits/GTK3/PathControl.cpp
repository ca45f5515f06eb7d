// SPDX-License-Identifier: MIT
#include <Varnel/GTK3/PathClicks.h>
#include <Varnel/GTK3/PathControl.h>

#include <utility>

namespace Varnel::GTK3 {

class PathControl::View final : public PathClicks {
 public:
  View(PathControl& widget, PathCell& cell) : PathClicks(widget), control_(widget), cell_(cell) {}

 private:
  [[nodiscard]] bool hasPathCell() const override { return cell_.hasURL(); }
  [[nodiscard]] std::shared_ptr<CommonPathControl::PathComponentCell> pathComponentCellAt(
      CommonPathControl::Point location) const override {
    return cell_.componentAt(control_, control_.get_allocated_width(),
                             static_cast<int>(location.x));
  }

  PathControl& control_;
  PathCell& cell_;
};

PathControl::PathControl() : view_(std::make_unique<View>(*this, cell_)) {
  add_events(Gdk::BUTTON_PRESS_MASK);
  set_has_tooltip();
}

PathControl::~PathControl() = default;

void PathControl::setURL(const Platform::URL& url, PathKind kind) {
  cell_.setURL(url, kind);
  get_accessible()->set_name(pathText(url, kind));
  set_tooltip_text(shownText(url.path()));
  queue_resize();
}

void PathControl::setOpen(Open open) {
  view_->setOpen(std::move(open));
}

CommonPathControl& PathControl::control() {
  return view_->control();
}

Gtk::SizeRequestMode PathControl::get_request_mode_vfunc() const {
  return Gtk::SIZE_REQUEST_CONSTANT_SIZE;
}

void PathControl::get_preferred_width_vfunc(int& minimum, int& natural) const {
  auto& widget = const_cast<PathControl&>(*this);
  cell_.get_preferred_width(widget, minimum, natural);
  natural = cell_.fullWidth(widget);
  minimum = std::min(minimum, natural);
}

void PathControl::get_preferred_height_vfunc(int& minimum, int& natural) const {
  cell_.get_preferred_height(const_cast<PathControl&>(*this), minimum, natural);
}

bool PathControl::on_draw(const Cairo::RefPtr<Cairo::Context>& context) {
  const Gdk::Rectangle area(0, 0, get_allocated_width(), get_allocated_height());
  cell_.render(context, *this, area, area, Gtk::CellRendererState{});
  return true;
}

bool PathControl::on_button_press_event(GdkEventButton* event) {
  return view_->press(*event, {event->x, event->y});
}

}  // namespace Varnel::GTK3
