// SPDX-License-Identifier: MIT
#pragma once

#include <gtkmm/actionbar.h>
#include <gtkmm/box.h>
#include <gtkmm/button.h>
#include <gtkmm/infobar.h>
#include <gtkmm/label.h>
#include <gtkmm/menubutton.h>
#include <gtkmm/scrolledwindow.h>
#include <gtkmm/stack.h>

#include <functional>
#include <string>

#include <Varnel/GTK3/PathControl.h>
#include <orvane-window/Interface/DuplicateView.h>

namespace Orvane {

class Session;

/// A line above the results that tells of something or asks it, until it is answered.
class Notice final : public Gtk::InfoBar {
 public:
  struct Answer {
    std::string identifier;
    std::string text;
    std::function<void()> chosen;
  };

  explicit Notice(const std::string& identifier);

  void tell(const std::string& text, Gtk::MessageType type, const std::vector<Answer>& answers);
  void withdraw() { hide(); }

 private:
  Gtk::Label text_;
  std::vector<Answer> answers_;
};

/// What a scan has found, and what is chosen of it. Main thread.
class ResultsPage final : public Gtk::Box {
 public:
  ResultsPage();

  /// The session's list is a new one.
  void showList(const Session& session);
  /// Another row is the current one.
  void showCurrent(const Session& session);
  /// Other files are chosen.
  void showChosen(const Session& session);
  void clear() { view_.clear(); }
  void focus() { view_.grab_focus(); }

  [[nodiscard]] DuplicateView& view() { return view_; }
  [[nodiscard]] Notice& outcome() { return outcome_; }
  [[nodiscard]] Notice& question() { return question_; }

 private:
  void addHead();
  void addFoot();

  Gtk::Box head_{Gtk::ORIENTATION_HORIZONTAL, 12};
  Gtk::Box summary_{Gtk::ORIENTATION_VERTICAL, 2};
  Gtk::Label title_;
  Gtk::Label detail_;
  Gtk::MenuButton select_;
  Notice outcome_{"outcome"};
  Notice question_{"question"};
  Gtk::Stack body_;
  Gtk::ScrolledWindow scroll_;
  DuplicateView view_;
  Gtk::Box none_{Gtk::ORIENTATION_VERTICAL, 12};
  Gtk::Label noneDetail_;
  Varnel::GTK3::PathControl path_;
  Gtk::ActionBar foot_;
  Gtk::Label chosen_;
  Gtk::Button remove_;
};

}  // namespace Orvane
