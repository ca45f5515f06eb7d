// SPDX-License-Identifier: MIT
#pragma once

#include <gtkmm/box.h>
#include <gtkmm/button.h>
#include <gtkmm/frame.h>
#include <gtkmm/image.h>
#include <gtkmm/label.h>
#include <gtkmm/listbox.h>
#include <gtkmm/scrolledwindow.h>

#include <functional>
#include <string>
#include <vector>

namespace Orvane {

/// The folders that are to be scanned. Main thread.
class FoldersPage final : public Gtk::Box {
 public:
  FoldersPage();

  void showFolders(const std::vector<std::string>& folders);
  /// Puts the focus where the user goes on.
  void focus();

  /// Set by the owner.
  std::function<void(const std::string&)> removed;

 private:
  void addRow(const std::string& folder);

  Gtk::Image icon_;
  Gtk::Label title_;
  Gtk::Label hint_;
  Gtk::Frame frame_;
  Gtk::ScrolledWindow scroll_;
  Gtk::ListBox list_;
  Gtk::Box buttons_{Gtk::ORIENTATION_HORIZONTAL, 12};
  Gtk::Button add_;
  Gtk::Button scan_;
};

}  // namespace Orvane
