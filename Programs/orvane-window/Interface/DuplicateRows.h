// SPDX-License-Identifier: MIT
#pragma once

#include <gtkmm/treemodel.h>
#include <gtkmm/treepath.h>

#include <cstddef>
#include <memory>
#include <optional>

#include <orvane-window/Model/DuplicateList.h>

namespace Orvane {

/// The rows of a list: its groups, and below each its files. It holds nothing of its own for a row,
/// so a list may have any length. A new model has no rows; `grow` lets them appear, some at a time,
/// because a view takes time for each.
///
/// Cells are filled by functions that look into the list: the one column here is empty. Main
/// thread.
class DuplicateRows final : public Gtk::TreeModel, public Glib::Object {
 public:
  /// The list stays as it is but for what is chosen.
  [[nodiscard]] static Glib::RefPtr<DuplicateRows> create(
      std::shared_ptr<const DuplicateList> list);

  [[nodiscard]] const std::shared_ptr<const DuplicateList>& list() const { return list_; }

  /// Shows some groups more; false when all are there.
  bool grow(std::size_t groups);
  /// Takes the last groups away; false when none is left. A view takes time for that too.
  bool shrink(std::size_t groups);

  /// Which group a row belongs to, and which of its files it shows, if it shows one.
  struct Row {
    std::size_t group = 0;
    std::optional<std::size_t> file{};
  };
  [[nodiscard]] static Row rowAt(const const_iterator& position);
  [[nodiscard]] static Path pathOf(std::size_t group);
  [[nodiscard]] static Path pathOf(DuplicateList::Place place);

 protected:
  Gtk::TreeModelFlags get_flags_vfunc() const override;
  int get_n_columns_vfunc() const override { return 1; }
  GType get_column_type_vfunc(int) const override { return G_TYPE_BOOLEAN; }
  void get_value_vfunc(const const_iterator&, int, Glib::ValueBase& value) const override;
  bool iter_next_vfunc(const const_iterator& position, iterator& next) const override;
  bool get_iter_vfunc(const Path& path, iterator& position) const override;
  bool iter_children_vfunc(const const_iterator& parent, iterator& first) const override;
  bool iter_parent_vfunc(const const_iterator& child, iterator& parent) const override;
  bool iter_nth_child_vfunc(const const_iterator& parent, int n, iterator& child) const override;
  bool iter_nth_root_child_vfunc(int n, iterator& child) const override;
  bool iter_has_child_vfunc(const const_iterator& position) const override;
  int iter_n_children_vfunc(const const_iterator& position) const override;
  int iter_n_root_children_vfunc() const override { return static_cast<int>(shown_); }
  Path get_path_vfunc(const const_iterator& position) const override;

 private:
  explicit DuplicateRows(std::shared_ptr<const DuplicateList> list);
  bool point(iterator& position, const Row& row) const;

  const std::shared_ptr<const DuplicateList> list_;
  std::size_t shown_ = 0;  ///< Groups.
};

}  // namespace Orvane
