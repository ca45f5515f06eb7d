// SPDX-License-Identifier: MIT
#pragma once

#include <gtkmm/box.h>
#include <gtkmm/button.h>
#include <gtkmm/label.h>
#include <gtkmm/progressbar.h>

#include <string>

namespace Orvane {

class Session;

/// How far the session's work is. Main thread.
class ProgressPage final : public Gtk::Box {
 public:
  ProgressPage();

  /// To be called a few times a second. Returns a line for the window's title.
  std::string refresh(const Session& session);
  void focus() { stop_.grab_focus(); }

 private:
  void showShare(double done, double all);

  Gtk::Label title_;
  Gtk::ProgressBar bar_;
  Gtk::Label detail_;
  Gtk::Button stop_;
};

}  // namespace Orvane
