// SPDX-License-Identifier: MIT
#include <orvane-window/Interface/DuplicateView.h>

#include <gdk/gdkkeysyms.h>
#include <giomm/contenttype.h>
#include <glibmm/datetime.h>
#include <glibmm/main.h>
#include <gtkmm/cellrendererpixbuf.h>
#include <gtkmm/cellrenderertext.h>
#include <gtkmm/cellrenderertoggle.h>

#include <chrono>
#include <string>

#include <orvane-window/Model/Texts.h>

namespace Orvane {
namespace {

using Clock = std::chrono::steady_clock;

// So much of a turn may go into rows; the rest is left to drawing and to the user's keys.
constexpr auto maxTurn = std::chrono::milliseconds(8);
constexpr std::size_t groupsAtOnce = 100;
// Enough to fill a screen.
constexpr std::size_t unfoldedAtFirst = 40;

std::string nameOf(const std::string& path) {
  return pathText(path.substr(path.rfind('/') + 1));
}

std::string folderOf(const std::string& path) {
  return pathText(path.substr(0, std::max<std::size_t>(path.rfind('/'), 1)), true);
}

std::string timeOf(const ReportFile& file) {
  return Glib::DateTime::create_now_local(file.modified).format("%x %R");
}

Gtk::TreeViewColumn& added(Gtk::TreeView& view, const char* titleKey, int width) {
  auto* column = Gtk::manage(
      new Gtk::TreeViewColumn(titleKey ? Glib::ustring(localized(titleKey)) : Glib::ustring()));
  column->set_sizing(Gtk::TREE_VIEW_COLUMN_FIXED);
  column->set_fixed_width(width);
  column->set_resizable(titleKey != nullptr);
  view.append_column(*column);
  return *column;
}

/// Fills a cell from what the row shows.
template <typename Renderer, typename Fill>
void pack(Gtk::TreeViewColumn& column, Renderer& renderer, bool isWide, Fill fill,
          const Glib::RefPtr<DuplicateRows>& rows) {
  column.pack_start(renderer, isWide);
  column.set_cell_data_func(
      renderer, [fill, &rows](Gtk::CellRenderer* cell, const Gtk::TreeModel::iterator& position) {
        if (rows) fill(static_cast<Renderer&>(*cell), rows->list(), DuplicateRows::rowAt(position));
      });
}

}  // namespace

DuplicateView::DuplicateView() {
  addColumns();
  set_fixed_height_mode(true);
  set_enable_search(false);
  set_headers_visible(true);
  get_accessible()->set_name(localized("Duplicates"));
  signal_row_activated().connect([this](const Gtk::TreeModel::Path& path, Gtk::TreeViewColumn*) {
    if (path.size() == 1)
      row_expanded(path) ? static_cast<void>(collapse_row(path))
                         : static_cast<void>(expand_row(path, false));
    else
      opened({static_cast<std::size_t>(path[0]), static_cast<std::size_t>(path[1])});
  });
  signal_popup_menu().connect([this] {
    menu().popup_at_widget(this, Gdk::GRAVITY_CENTER, Gdk::GRAVITY_NORTH_WEST, nullptr);
    return true;
  });
  signal_cursor_changed().connect([this] { moved(); });
}

DuplicateView::~DuplicateView() {
  work_.disconnect();
}

void DuplicateView::addColumns() {
  using Row = DuplicateRows::Row;
  using List = DuplicateList;
  auto& choice = added(*this, nullptr, 34);
  auto* toggle = Gtk::manage(new Gtk::CellRendererToggle);
  pack(
      choice, *toggle, true,
      [](Gtk::CellRendererToggle& cell, const List& list, const Row& row) {
        cell.property_visible() = row.file.has_value();
        if (!row.file) return;
        cell.property_active() = list.isChosen({row.group, *row.file});
        cell.property_sensitive() = !list.file({row.group, *row.file}).isReference;
      },
      rows_);
  toggle->signal_toggled().connect([this](const Glib::ustring& text) {
    const Gtk::TreeModel::Path path(text);
    if (path.size() == 2)
      toggled({static_cast<std::size_t>(path[0]), static_cast<std::size_t>(path[1])});
  });

  auto& name = added(*this, "Column_Name", 300);
  auto* icon = Gtk::manage(new Gtk::CellRendererPixbuf);
  pack(
      name, *icon, false,
      [](Gtk::CellRendererPixbuf& cell, const List& list, const Row& row) {
        cell.property_visible() = !row.file;
        if (row.file) return;
        bool isUncertain = false;
        const std::string& path = list.group(row.group).files.front().path;
        const auto type = Gio::content_type_guess(nameOf(path), nullptr, 0, isUncertain);
        cell.property_gicon() = Gio::content_type_get_icon(type);
      },
      rows_);
  auto* title = Gtk::manage(new Gtk::CellRendererText);
  title->property_ellipsize() = Pango::ELLIPSIZE_MIDDLE;
  pack(
      name, *title, true,
      [](Gtk::CellRendererText& cell, const List& list, const Row& row) {
        cell.property_text() = nameOf(list.file({row.group, row.file.value_or(0)}).path);
        cell.property_weight() = row.file ? PANGO_WEIGHT_NORMAL : PANGO_WEIGHT_BOLD;
      },
      rows_);
  set_expander_column(name);

  auto& folder = added(*this, "Column_Folder", 330);
  folder.set_expand(true);
  auto* place = Gtk::manage(new Gtk::CellRendererText);
  place->property_ellipsize() = Pango::ELLIPSIZE_MIDDLE;
  pack(
      folder, *place, true,
      [](Gtk::CellRendererText& cell, const List& list, const Row& row) {
        const auto& files = list.group(row.group).files;
        cell.property_text() = row.file ? folderOf(files[*row.file].path)
                                        : localized("Group_Files", {countText(files.size())});
        cell.property_sensitive() = row.file.has_value();
      },
      rows_);

  auto& size = added(*this, "Column_Size", 110);
  size.set_alignment(1.0f);
  auto* bytes = Gtk::manage(new Gtk::CellRendererText);
  bytes->property_xalign() = 1.0f;
  pack(
      size, *bytes, true,
      [](Gtk::CellRendererText& cell, const List& list, const Row& row) {
        cell.property_text() = sizeText(list.group(row.group).size);
        cell.property_sensitive() = !row.file.has_value();
      },
      rows_);

  auto& modified = added(*this, "Column_Modified", 150);
  auto* time = Gtk::manage(new Gtk::CellRendererText);
  pack(
      modified, *time, true,
      [](Gtk::CellRendererText& cell, const List& list, const Row& row) {
        cell.property_text() = row.file ? timeOf(list.file({row.group, *row.file})) : std::string();
      },
      rows_);
}

void DuplicateView::showList(const DuplicateList& list) {
  clear();
  rows_ = DuplicateRows::create(list);
  set_model(rows_);
  isGrowing_ = rows_->grow(unfoldedAtFirst);
  for (int i = 0; i < static_cast<int>(rows_->children().size()); ++i)
    expand_row(Gtk::TreeModel::Path(std::to_string(i)), false);
  keepGoing();
}

void DuplicateView::clear() {
  work_.disconnect();
  isGrowing_ = false;
  nextExpanded_.reset();
  unset_model();
  rows_.reset();
}

void DuplicateView::keepGoing() {
  if (!work_.connected()) work_ = Glib::signal_idle().connect([this] { return goOn(); });
}

bool DuplicateView::goOn() {
  const auto end = Clock::now() + maxTurn;
  while (isGrowing_ && Clock::now() < end) isGrowing_ = rows_->grow(groupsAtOnce);
  while (!isGrowing_ && nextExpanded_ && Clock::now() < end) {
    Gtk::TreeModel::Path path;
    path.push_back(static_cast<int>(*nextExpanded_));
    expand_row(path, false);
    if (++*nextExpanded_ >= rows_->list().report()->groups.size()) nextExpanded_.reset();
  }
  return isGrowing_ || nextExpanded_;
}

void DuplicateView::expandAll() {
  if (!rows_ || rows_->list().report()->groups.empty()) return;
  nextExpanded_ = 0;
  keepGoing();
}

// A new model has nothing unfolded, which is quicker than folding row by row.
void DuplicateView::collapseAll() {
  if (!rows_) return;
  const DuplicateList& list = rows_->list();
  clear();
  rows_ = DuplicateRows::create(list);
  set_model(rows_);
  isGrowing_ = rows_->grow(unfoldedAtFirst);
  keepGoing();
}

void DuplicateView::goTo(Place place) {
  const auto path = DuplicateRows::pathOf(place);
  expand_to_path(path);
  set_cursor(path);
  scroll_to_row(path, 0.4f);
}

std::optional<DuplicateView::Place> DuplicateView::current() const {
  Gtk::TreeModel::Path path;
  Gtk::TreeViewColumn* column = nullptr;
  const_cast<DuplicateView*>(this)->get_cursor(path, column);
  if (!rows_ || path.empty()) return std::nullopt;
  return Place{static_cast<std::size_t>(path[0]),
               path.size() > 1 ? static_cast<std::size_t>(path[1]) : 0};
}

void DuplicateView::toggleCurrent() {
  Gtk::TreeModel::Path path;
  Gtk::TreeViewColumn* column = nullptr;
  get_cursor(path, column);
  if (path.size() == 2)
    toggled({static_cast<std::size_t>(path[0]), static_cast<std::size_t>(path[1])});
}

bool DuplicateView::on_key_press_event(GdkEventKey* event) {
  Gtk::TreeModel::Path path;
  Gtk::TreeViewColumn* column = nullptr;
  get_cursor(path, column);
  const bool isPlain = (event->state & (GDK_CONTROL_MASK | GDK_MOD1_MASK | GDK_SHIFT_MASK)) == 0;
  if (isPlain && !path.empty()) {
    Gtk::TreeModel::Path group;
    group.push_back(path[0]);
    switch (event->keyval) {
      case GDK_KEY_space:
        toggleCurrent();
        return true;
      case GDK_KEY_Right:
        expand_row(group, false);
        return true;
      case GDK_KEY_Left:
        if (path.size() > 1)
          set_cursor(group);
        else
          collapse_row(group);
        return true;
      default:
        break;
    }
  }
  return Gtk::TreeView::on_key_press_event(event);
}

bool DuplicateView::on_button_press_event(GdkEventButton* event) {
  if (event->type == GDK_BUTTON_PRESS && event->button == GDK_BUTTON_SECONDARY) {
    Gtk::TreeModel::Path path;
    if (get_path_at_pos(static_cast<int>(event->x), static_cast<int>(event->y), path))
      set_cursor(path);
    menu().popup_at_pointer(reinterpret_cast<GdkEvent*>(event));
    return true;
  }
  return Gtk::TreeView::on_button_press_event(event);
}

}  // namespace Orvane
