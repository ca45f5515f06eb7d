// SPDX-License-Identifier: MIT
#include <orvane-window/Interface/DuplicateRows.h>

#include <algorithm>
#include <cstdint>
#include <utility>

namespace Orvane {
namespace {

// The view compares stamps only to know that a position is one at all.
constexpr int stamp = 1;

}  // namespace

Glib::RefPtr<DuplicateRows> DuplicateRows::create(std::shared_ptr<const DuplicateList> list) {
  return Glib::RefPtr<DuplicateRows>(new DuplicateRows(std::move(list)));
}

DuplicateRows::DuplicateRows(std::shared_ptr<const DuplicateList> list)
    : Glib::ObjectBase(typeid(DuplicateRows)), list_(std::move(list)) {}

bool DuplicateRows::grow(std::size_t groups) {
  const std::size_t end = std::min(shown_ + groups, list_->report()->groups.size());
  while (shown_ < end) {
    iterator position;
    const std::size_t number = shown_++;
    point(position, {number, std::nullopt});
    const Path path = pathOf(number);
    row_inserted(path, position);
    row_has_child_toggled(path, position);
  }
  return shown_ < list_->report()->groups.size();
}

bool DuplicateRows::shrink(std::size_t groups) {
  for (; groups > 0 && shown_ > 0; --groups) row_deleted(pathOf(--shown_));
  return shown_ > 0;
}

// A position is two numbers, the second one of which is a file's, from 1 on, or 0.
bool DuplicateRows::point(iterator& position, const Row& row) const {
  position.set_stamp(stamp);
  position.gobj()->user_data = GSIZE_TO_POINTER(row.group);
  position.gobj()->user_data2 = GSIZE_TO_POINTER(row.file ? *row.file + 1 : 0);
  position.gobj()->user_data3 = nullptr;
  return true;
}

DuplicateRows::Row DuplicateRows::rowAt(const const_iterator& position) {
  Row row{.group = reinterpret_cast<std::uintptr_t>(position.gobj()->user_data)};
  const auto file = reinterpret_cast<std::uintptr_t>(position.gobj()->user_data2);
  if (file > 0) row.file = file - 1;
  return row;
}

DuplicateRows::Path DuplicateRows::pathOf(DuplicateList::Place place) {
  Path path = pathOf(place.group);
  path.push_back(static_cast<int>(place.file));
  return path;
}

DuplicateRows::Path DuplicateRows::pathOf(std::size_t group) {
  Path path;
  path.push_back(static_cast<int>(group));
  return path;
}

Gtk::TreeModelFlags DuplicateRows::get_flags_vfunc() const {
  return Gtk::TREE_MODEL_ITERS_PERSIST;
}

void DuplicateRows::get_value_vfunc(const const_iterator&, int, Glib::ValueBase& value) const {
  value.init(G_TYPE_BOOLEAN);
}

bool DuplicateRows::iter_next_vfunc(const const_iterator& position, iterator& next) const {
  Row row = rowAt(position);
  if (row.file) {
    if (++*row.file >= list_->group(row.group).files.size()) return false;
  } else if (++row.group >= shown_) {
    return false;
  }
  return point(next, row);
}

bool DuplicateRows::get_iter_vfunc(const Path& path, iterator& position) const {
  if (path.empty() || path.size() > 2 || path[0] < 0) return false;
  Row row{.group = static_cast<std::size_t>(path[0])};
  if (row.group >= shown_) return false;
  if (path.size() == 2) {
    if (path[1] < 0) return false;
    row.file = static_cast<std::size_t>(path[1]);
    if (*row.file >= list_->group(row.group).files.size()) return false;
  }
  return point(position, row);
}

bool DuplicateRows::iter_children_vfunc(const const_iterator& parent, iterator& first) const {
  return iter_nth_child_vfunc(parent, 0, first);
}

bool DuplicateRows::iter_parent_vfunc(const const_iterator& child, iterator& parent) const {
  const Row row = rowAt(child);
  return row.file && point(parent, {row.group, std::nullopt});
}

bool DuplicateRows::iter_nth_child_vfunc(const const_iterator& parent, int n,
                                         iterator& child) const {
  const Row row = rowAt(parent);
  const auto file = static_cast<std::size_t>(n);
  if (row.file || n < 0 || file >= list_->group(row.group).files.size()) return false;
  return point(child, {row.group, file});
}

bool DuplicateRows::iter_nth_root_child_vfunc(int n, iterator& child) const {
  const auto group = static_cast<std::size_t>(n);
  return n >= 0 && group < shown_ && point(child, {group, std::nullopt});
}

bool DuplicateRows::iter_has_child_vfunc(const const_iterator& position) const {
  return !rowAt(position).file;
}

int DuplicateRows::iter_n_children_vfunc(const const_iterator& position) const {
  const Row row = rowAt(position);
  return row.file ? 0 : static_cast<int>(list_->group(row.group).files.size());
}

DuplicateRows::Path DuplicateRows::get_path_vfunc(const const_iterator& position) const {
  const Row row = rowAt(position);
  Path path = pathOf(row.group);
  if (row.file) path.push_back(static_cast<int>(*row.file));
  return path;
}

}  // namespace Orvane
