// SPDX-License-Identifier: MIT
#include <orvane-window/Interface/DuplicateView.h>

#include <gdk/gdkkeysyms.h>
#include <giomm/contenttype.h>
#include <glibmm/datetime.h>
#include <glibmm/main.h>
#include <gtkmm/cellrendererpixbuf.h>
#include <gtkmm/cellrenderertext.h>
#include <gtkmm/cellrenderertoggle.h>

#include <algorithm>
#include <chrono>
#include <string>
#include <utility>

#include <orvane-window/Model/Texts.h>

namespace Orvane {
namespace {

using Clock = std::chrono::steady_clock;
using Row = DuplicateRows::Row;

// So much of a turn may go into rows; the rest is left to drawing and to the user's keys.
constexpr auto maxTurn = std::chrono::milliseconds(8);
constexpr std::size_t groupsAtOnce = 100;
// Enough to fill a screen.
constexpr std::size_t unfoldedAtFirst = 40;

std::string nameOf(const std::string& path) {
  return pathText(path.substr(path.rfind('/') + 1));
}

std::string timeOf(const ReportFile& file) {
  return Glib::DateTime::create_now_local(file.modified).format("%x %R");
}

// Of one line, whatever the width: all rows are of one height.
Gtk::CellRendererText* textCell() {
  auto* cell = Gtk::manage(new Gtk::CellRendererText);
  cell->property_ellipsize() = Pango::ELLIPSIZE_MIDDLE;
  return cell;
}

/// Of a column for such texts, in the user's font.
int widthFor(Gtk::Widget& widget, const std::string& text, int min) {
  constexpr int padding = 12;
  int width = 0;
  int height = 0;
  widget.create_pango_layout(text)->get_pixel_size(width, height);
  return std::max(width + padding, min);
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
        if (rows)
          fill(static_cast<Renderer&>(*cell), *rows->list(), DuplicateRows::rowAt(position));
      });
}

}  // namespace

Varnel::Platform::URL folderOf(const std::string& path) {
  return Varnel::Platform::URL::fileURLWithPath(path.substr(0, path.rfind('/') + 1));
}

DuplicateView::DuplicateView() {
  addChoice();
  addName();
  addFolder();
  addFigures();
  set_fixed_height_mode(true);
  set_enable_search(false);
  set_headers_visible(true);
  get_accessible()->set_name(localized("Duplicates"));
  signal_row_activated().connect([this](const Gtk::TreeModel::Path& path, Gtk::TreeViewColumn*) {
    if (path.size() == 1)
      row_expanded(path) ? static_cast<void>(collapse_row(path))
                         : static_cast<void>(expand_row(path, false));
    else if (!isLeaving_)
      opened({static_cast<std::size_t>(path[0]), static_cast<std::size_t>(path[1])});
  });
  signal_cursor_changed().connect([this] { moved(); });
}

DuplicateView::~DuplicateView() {
  work_.disconnect();
}

void DuplicateView::addChoice() {
  auto& choice = added(*this, nullptr, 34);
  auto* toggle = Gtk::manage(new Gtk::CellRendererToggle);
  pack(
      choice, *toggle, true,
      [](Gtk::CellRendererToggle& cell, const DuplicateList& list, const Row& row) {
        cell.property_visible() = row.file.has_value();
        if (!row.file) return;
        cell.property_active() = list.isChosen({row.group, *row.file});
        cell.property_sensitive() = !list.file({row.group, *row.file}).isReference;
      },
      rows_);
  toggle->signal_toggled().connect(
      [this](const Glib::ustring& path) { this->toggle(Gtk::TreeModel::Path(path)); });
}

void DuplicateView::addName() {
  auto& name = added(*this, "Column_Name", 300);
  auto* icon = Gtk::manage(new Gtk::CellRendererPixbuf);
  pack(
      name, *icon, false,
      [](Gtk::CellRendererPixbuf& cell, const DuplicateList& list, const Row& row) {
        cell.property_visible() = !row.file;
        if (row.file) return;
        bool isUncertain = false;
        const std::string& path = list.group(row.group).files.front().path;
        const auto type = Gio::content_type_guess(nameOf(path), nullptr, 0, isUncertain);
        cell.property_gicon() = Gio::content_type_get_icon(type);
      },
      rows_);
  auto* title = textCell();
  pack(
      name, *title, true,
      [](Gtk::CellRendererText& cell, const DuplicateList& list, const Row& row) {
        cell.property_text() = nameOf(list.file({row.group, row.file.value_or(0)}).path);
        cell.property_weight() = row.file ? PANGO_WEIGHT_NORMAL : PANGO_WEIGHT_BOLD;
      },
      rows_);
  set_expander_column(name);
}

void DuplicateView::addFolder() {
  using Location = Varnel::GTK3::PathColumn::Location;
  folder_.emplace(*this, localized("Column_Folder"),
                  [this](const auto& position) -> std::optional<Location> {
                    const Row row = DuplicateRows::rowAt(position);
                    if (!rows_ || !row.file) return std::nullopt;
                    const auto& path = rows_->list()->file({row.group, *row.file}).path;
                    return Location{folderOf(path), Varnel::GTK3::PathKind::folder};
                  });
  folder_->set_sizing(Gtk::TREE_VIEW_COLUMN_FIXED);
  folder_->set_fixed_width(330);
  folder_->set_resizable();
  auto* count = textCell();
  count->property_sensitive() = false;
  pack(
      *folder_, *count, true,
      [](Gtk::CellRendererText& cell, const DuplicateList& list, const Row& row) {
        cell.property_visible() = !row.file;
        if (!row.file)
          cell.property_text() =
              localized("Group_Files", {countText(list.group(row.group).files.size())});
      },
      rows_);
}

void DuplicateView::addFigures() {
  auto& size = added(*this, "Column_Size", widthFor(*this, sizeText(999'990'000'000), 110));
  size.set_alignment(1.0f);
  auto* bytes = textCell();
  bytes->property_xalign() = 1.0f;
  pack(
      size, *bytes, true,
      [](Gtk::CellRendererText& cell, const DuplicateList& list, const Row& row) {
        cell.property_text() = sizeText(list.group(row.group).size);
        cell.property_sensitive() = !row.file.has_value();
      },
      rows_);
  auto& modified = added(*this, "Column_Modified", widthFor(*this, timeOf({}), 150));
  auto* time = textCell();
  pack(
      modified, *time, true,
      [](Gtk::CellRendererText& cell, const DuplicateList& list, const Row& row) {
        cell.property_text() = row.file ? timeOf(list.file({row.group, *row.file})) : std::string();
      },
      rows_);
}

void DuplicateView::showList(std::shared_ptr<const DuplicateList> list) {
  replace(std::move(list), unfoldedAtFirst);
}

// All rows go and come again: in a long list that is hardly slower than folding each. The user sees
// those folded at once that are on the screen.
void DuplicateView::collapseAll() {
  if (!rows_ || isLeaving_) return;
  const auto place = current();
  Gtk::TreeModel::Path first, last;
  if (get_visible_range(first, last))
    for (std::size_t i = 0; i < unfoldedAtFirst; ++i)
      collapse_row(DuplicateRows::pathOf(static_cast<std::size_t>(first[0]) + i));
  replace(rows_->list(), 0, place ? std::optional(place->group) : std::nullopt);
}

void DuplicateView::expandAll() {
  if (!rows_ || isLeaving_ || rows_->list()->report()->groups.empty()) return;
  nextUnfolded_ = 0;
  if (!work_.connected()) work_ = Glib::signal_idle().connect([this] { return goOn(); });
}

void DuplicateView::replace(std::shared_ptr<const DuplicateList> list, std::size_t unfolded,
                            std::optional<std::size_t> group) {
  next_ = std::move(list);
  unfoldedNext_ = unfolded;
  groupNext_ = group;
  isLeaving_ = true;
  isGrowing_ = false;
  nextUnfolded_.reset();
  work_.disconnect();
  if (goOn()) work_ = Glib::signal_idle().connect([this] { return goOn(); });
}

void DuplicateView::begin() {
  unset_model();
  rows_.reset();
  isLeaving_ = false;
  if (!next_) return;
  rows_ = DuplicateRows::create(std::exchange(next_, nullptr));
  set_model(rows_);
  isGrowing_ = rows_->grow(unfoldedAtFirst);
  for (std::size_t i = 0; i < std::min<std::size_t>(unfoldedNext_, rows_->children().size()); ++i)
    expand_row(DuplicateRows::pathOf(i), false);
}

bool DuplicateView::goOn() {
  const auto end = Clock::now() + maxTurn;
  bool isShrinking = isLeaving_ && rows_;
  while (isShrinking && Clock::now() < end) isShrinking = rows_->shrink(groupsAtOnce);
  if (isLeaving_ && !isShrinking) begin();
  while (isGrowing_ && Clock::now() < end) isGrowing_ = rows_->grow(groupsAtOnce);
  if (!isLeaving_ && !isGrowing_ && groupNext_) {
    if (!current()) set_cursor(DuplicateRows::pathOf(*groupNext_));
    groupNext_.reset();
  }
  while (!isGrowing_ && nextUnfolded_ && Clock::now() < end) {
    expand_row(DuplicateRows::pathOf(*nextUnfolded_), false);
    if (++*nextUnfolded_ >= rows_->list()->report()->groups.size()) nextUnfolded_.reset();
  }
  return isLeaving_ || isGrowing_ || nextUnfolded_;
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
  if (!rows_ || isLeaving_ || path.empty()) return std::nullopt;
  return Place{static_cast<std::size_t>(path[0]),
               path.size() > 1 ? static_cast<std::size_t>(path[1]) : 0};
}

void DuplicateView::toggle(const Gtk::TreeModel::Path& path) {
  if (path.size() == 2 && !isLeaving_)
    toggled({static_cast<std::size_t>(path[0]), static_cast<std::size_t>(path[1])});
}

bool DuplicateView::on_key_press_event(GdkEventKey* event) {
  Gtk::TreeModel::Path path;
  Gtk::TreeViewColumn* column = nullptr;
  get_cursor(path, column);
  const bool isPlain = (event->state & (GDK_CONTROL_MASK | GDK_MOD1_MASK | GDK_SHIFT_MASK)) == 0;
  if (isPlain && !path.empty()) {
    const auto group = DuplicateRows::pathOf(static_cast<std::size_t>(path[0]));
    switch (event->keyval) {
      case GDK_KEY_space:
        toggle(path);
        return true;
      case GDK_KEY_Left:
      case GDK_KEY_Right:
        // Rows unfold in the direction in which the user reads.
        if ((event->keyval == GDK_KEY_Right) == (get_direction() == Gtk::TEXT_DIR_LTR))
          expand_row(group, false);
        else if (path.size() > 1)
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

}  // namespace Orvane
