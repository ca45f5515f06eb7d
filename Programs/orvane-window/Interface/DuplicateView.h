// SPDX-License-Identifier: MIT
#pragma once

#include <gtkmm/treeview.h>

#include <cstddef>
#include <functional>
#include <memory>
#include <optional>
#include <string>

#include <Varnel/GTK3/PathColumn.h>
#include <orvane-window/Interface/DuplicateRows.h>

namespace Orvane {

/// The folder of a file.
[[nodiscard]] Varnel::Platform::URL folderOf(const std::string& path);

/// The list of groups and files. Space chooses a file, Return opens it, the arrows to the left and
/// right fold a group. What takes long in a long list is spread over many turns of the main loop.
/// Main thread.
class DuplicateView final : public Gtk::TreeView {
 public:
  using Place = DuplicateList::Place;

  DuplicateView();
  ~DuplicateView() override;

  /// In place of the one before. The first groups are unfolded.
  void showList(std::shared_ptr<const DuplicateList> list);
  void clear() { showList(nullptr); }
  /// Shows anew what is chosen.
  void refresh() { queue_draw(); }

  void expandAll();
  void collapseAll();
  /// Makes the file the current row.
  void goTo(Place place);
  /// The file of the current row, or the first one of its group.
  [[nodiscard]] std::optional<Place> current() const;

  // Set by the owner; each must be.
  std::function<void(Place)> toggled;
  std::function<void(Place)> opened;
  std::function<void()> moved;  ///< Another row is the current one.

 protected:
  bool on_key_press_event(GdkEventKey* event) override;

 private:
  void addChoice();
  void addName();
  void addFolder();
  void addFigures();
  void toggle(const Gtk::TreeModel::Path& path);
  void replace(std::shared_ptr<const DuplicateList> list, std::size_t unfolded,
               std::optional<std::size_t> group = std::nullopt);
  void begin();
  bool goOn();

  Glib::RefPtr<DuplicateRows> rows_;
  std::optional<Varnel::GTK3::PathColumn> folder_;
  bool isLeaving_ = false;  ///< The rows are being taken away, for those of the next list.
  bool isGrowing_ = false;
  std::optional<std::size_t> nextUnfolded_;  ///< While all groups are being unfolded.
  std::shared_ptr<const DuplicateList> next_;
  std::size_t unfoldedNext_ = 0;          ///< How many of its groups.
  std::optional<std::size_t> groupNext_;  ///< The current one, once all rows are there.
  sigc::connection work_;
};

}  // namespace Orvane
