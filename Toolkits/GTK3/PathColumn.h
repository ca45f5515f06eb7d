// SPDX-License-Identifier: MIT
#pragma once

#include <gtkmm/treemodel.h>
#include <gtkmm/treeviewcolumn.h>

#include <functional>
#include <memory>
#include <optional>

#include <Varnel/GTK3/DisplayTexts.h>
#include <Varnel/GTK3/PathCell.h>
#include <Varnel/Paths/CommonPathControl.h>
#include <Varnel/Platform/Api.h>
#include <Varnel/Platform/Values/URL.h>

namespace Gtk {
class TreeView;
}

namespace Varnel::GTK3 {

/// A column of a tree view that shows paths as rows of components with icons, for lists of any
/// length: nothing is kept for a row. A single click selects the row; a double click on a component
/// opens it; a right click, or the menu key, selects the row unless it is selected, and shows the
/// menu of the list (`setListMenu`).
///
///     PathColumn paths(view, _("Name"), [this](const auto& row) -> std::optional<Location> {
///       return Location{row[columns.url], PathKind::file};
///     });
///
/// Rows without a location show what the host packs besides. The column appends itself to the view
/// and goes before it. Main thread only.
class VARNEL_API PathColumn final : public Gtk::TreeViewColumn {
 public:
  struct Location {
    Platform::URL url;
    PathKind kind = PathKind::file;
  };
  using LocationOf = std::function<std::optional<Location>(const Gtk::TreeModel::iterator& row)>;
  using Open = std::function<void(const Platform::URL& url)>;

  PathColumn(Gtk::TreeView& view, const Glib::ustring& title, LocationOf locationOf);
  ~PathColumn() override;

  /// What a double click on a component does; unless set, the desktop opens it (`openURL`).
  void setOpen(Open open);

  [[nodiscard]] CommonPathControl& control();

 private:
  class View;

  PathCell cell_;
  const std::unique_ptr<View> view_;
};

}  // namespace Varnel::GTK3
