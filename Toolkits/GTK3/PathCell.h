// SPDX-License-Identifier: MIT
#pragma once

#include <gtkmm/cellrenderer.h>
#include <gtkmm/cellrendererpixbuf.h>
#include <gtkmm/cellrenderertext.h>

#include <memory>
#include <optional>
#include <string>
#include <vector>

#include <Varnel/GTK3/DisplayTexts.h>
#include <Varnel/Paths/CommonPathControl.h>
#include <Varnel/Platform/Api.h>
#include <Varnel/Platform/Values/URL.h>

namespace Varnel::GTK3 {

/// Draws a path as a row of components, each with an icon: in a list (`PathColumn`), or as a widget
/// of its own (`PathControl`). A path too long for its place loses components at its start.
///
/// Its text, which a screen reader reads, is the path's short form. The file system is not asked.
/// Main thread only.
class VARNEL_API PathCell final : public Gtk::CellRendererText {
 public:
  using ComponentCell = CommonPathControl::PathComponentCell;

  PathCell();

  /// What is drawn from now on; none for nothing.
  void setURL(const std::optional<Platform::URL>& url, PathKind kind = PathKind::file);
  [[nodiscard]] bool hasURL() const { return !components_.empty(); }

  /// The component at a place of an area of this width; null beside them.
  [[nodiscard]] std::shared_ptr<ComponentCell> componentAt(Gtk::Widget& widget, int width, int x);

  /// The width at which the whole path shows.
  [[nodiscard]] int fullWidth(Gtk::Widget& widget);

 protected:
  void get_preferred_width_vfunc(Gtk::Widget& widget, int& minimum, int& natural) const override;
  void get_preferred_height_vfunc(Gtk::Widget& widget, int& minimum, int& natural) const override;
  void get_preferred_height_for_width_vfunc(Gtk::Widget& widget, int width, int& minimum,
                                            int& natural) const override;
  void render_vfunc(const Cairo::RefPtr<Cairo::Context>& context, Gtk::Widget& widget,
                    const Gdk::Rectangle& background, const Gdk::Rectangle& area,
                    Gtk::CellRendererState flags) override;

 private:
  struct Component {
    Platform::URL url;
    std::string name;
    std::string icon;
  };
  struct Piece {  ///< A component in its place.
    const Component* component;
    int x;
    int iconWidth;
    int width;
  };

  [[nodiscard]] std::vector<Piece> layOut(Gtk::Widget& widget, int width);
  [[nodiscard]] static int fullTextWidth(Gtk::Widget& widget, const std::string& text);

  std::vector<Component> components_;
  Gtk::CellRendererPixbuf icon_;
  Gtk::CellRendererText text_;
};

}  // namespace Varnel::GTK3
