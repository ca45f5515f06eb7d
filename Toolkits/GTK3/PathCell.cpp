// SPDX-License-Identifier: MIT
#include <Varnel/GTK3/PathCell.h>
#include <Varnel/Paths/QNURLResolver.h>
#include <Varnel/Platform/Values/PathComponents.h>
#include <giomm/contenttype.h>
#include <gtkmm/widget.h>

#include <algorithm>
#include <utility>

namespace Varnel::GTK3 {
namespace {

constexpr int minimumWidth = 48;
constexpr int iconGap = 3;
constexpr int componentGap = 8;

class NamedComponent final : public CommonPathControl::PathComponentCell {
 public:
  explicit NamedComponent(Platform::URL url) : url_(std::move(url)) {}
  [[nodiscard]] Platform::URL url() const override { return url_; }

 private:
  Platform::URL url_;
};

std::string iconOf(const std::string& name, bool isFolder) {
  if (name == "~") return "user-home-symbolic";
  if (name == "/") return "drive-harddisk-symbolic";
  if (isFolder) return "folder-symbolic";
  // The name alone: looking into the file might take long.
  bool isUncertain = false;
  const Glib::ustring type = Gio::content_type_guess(shownText(name), nullptr, 0, isUncertain);
  if (type.raw().starts_with("image/")) return "image-x-generic-symbolic";
  if (type.raw().starts_with("audio/")) return "audio-x-generic-symbolic";
  if (type.raw().starts_with("video/")) return "video-x-generic-symbolic";
  return "text-x-generic-symbolic";
}

int naturalWidth(const Gtk::CellRenderer& cell, Gtk::Widget& widget) {
  int minimum = 0;
  int natural = 0;
  cell.get_preferred_width(widget, minimum, natural);
  return natural;
}

}  // namespace

PathCell::PathCell() : Glib::ObjectBase(typeid(PathCell)) {
  text_.property_single_paragraph_mode() = true;
  text_.property_ellipsize() = Pango::ELLIPSIZE_MIDDLE;
  text_.property_xpad() = 0;
  icon_.property_xpad() = 0;
}

void PathCell::setURL(const std::optional<Platform::URL>& url, PathKind kind) {
  components_.clear();
  property_text() = url ? pathText(*url, kind) : std::string();
  if (!url) return;
  const auto& resolver = QNURLResolver::shared();
  const auto full = Platform::pathComponents(*url);
  const auto shown = resolver.abbreviatedPathComponents(full);
  // The short form replaces the first components by one.
  const std::size_t replaced = full.size() - shown.size();
  for (std::size_t i = 0; i < shown.size(); ++i) {
    const bool isFolder = i + 1 < shown.size() || kind == PathKind::folder;
    const auto end = full.begin() + static_cast<std::ptrdiff_t>(replaced + i + 1);
    const std::string path = Platform::joinPathComponents({full.begin(), end});
    components_.push_back(
        {Platform::URL::fileURLWithPath(isFolder && path != "/" ? path + "/" : path),
         shownText(shown[i]), iconOf(shown[i], isFolder)});
  }
}

std::vector<PathCell::Piece> PathCell::layOut(Gtk::Widget& widget, int width) {
  std::vector<Piece> pieces;
  int left = width;
  // From the end on, whose components tell most.
  for (auto component = components_.rbegin(); component != components_.rend(); ++component) {
    icon_.property_icon_name() = component->icon;
    text_.property_text() = component->name;
    const int icon = naturalWidth(icon_, widget);
    const int needed = icon + iconGap + fullTextWidth(widget, component->name);
    const int gap = pieces.empty() ? 0 : componentGap;
    if (!pieces.empty() && needed + gap > left) break;
    const int taken = std::min(needed, std::max(left - gap, 0));
    left -= taken + gap;
    pieces.push_back({&*component, 0, icon, taken});
  }
  std::ranges::reverse(pieces);
  int x = 0;
  for (Piece& piece : pieces) {
    piece.x = x;
    x += piece.width + componentGap;
  }
  return pieces;
}

int PathCell::fullTextWidth(Gtk::Widget& widget, const std::string& text) {
  int width = 0;
  int height = 0;
  widget.create_pango_layout(text)->get_pixel_size(width, height);
  return width + 1;
}

int PathCell::fullWidth(Gtk::Widget& widget) {
  const auto pieces = layOut(widget, G_MAXINT / 2);
  return pieces.empty() ? minimumWidth : pieces.back().x + pieces.back().width;
}

std::shared_ptr<PathCell::ComponentCell> PathCell::componentAt(Gtk::Widget& widget, int width,
                                                               int x) {
  for (const Piece& piece : layOut(widget, width))
    if (x >= piece.x && x < piece.x + piece.width)
      return std::make_shared<NamedComponent>(piece.component->url);
  return nullptr;
}

// A column takes the width that it gets: measuring each row of a long list would take too long.
void PathCell::get_preferred_width_vfunc(Gtk::Widget&, int& minimum, int& natural) const {
  minimum = natural = minimumWidth;
}

void PathCell::get_preferred_height_vfunc(Gtk::Widget& widget, int& minimum, int& natural) const {
  text_.get_preferred_height(widget, minimum, natural);
}

// A text that is too long would take another line.
void PathCell::get_preferred_height_for_width_vfunc(Gtk::Widget& widget, int, int& minimum,
                                                    int& natural) const {
  get_preferred_height_vfunc(widget, minimum, natural);
}

void PathCell::render_vfunc(const Cairo::RefPtr<Cairo::Context>& context, Gtk::Widget& widget,
                            const Gdk::Rectangle& background, const Gdk::Rectangle& area,
                            Gtk::CellRendererState flags) {
  for (const Piece& piece : layOut(widget, area.get_width())) {
    const int x = area.get_x() + piece.x;
    const int textOffset = piece.iconWidth + iconGap;
    icon_.property_icon_name() = piece.component->icon;
    icon_.render(context, widget, background, {x, area.get_y(), piece.iconWidth, area.get_height()},
                 flags);
    text_.property_text() = piece.component->name;
    text_.render(
        context, widget, background,
        {x + textOffset, area.get_y(), std::max(piece.width - textOffset, 1), area.get_height()},
        flags);
  }
}

}  // namespace Varnel::GTK3
