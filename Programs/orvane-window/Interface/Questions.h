// SPDX-License-Identifier: MIT
#pragma once

#include <gtkmm/dialog.h>
#include <gtkmm/window.h>

#include <functional>
#include <memory>
#include <string>
#include <vector>

#include <orvane-window/Model/Engine.h>

namespace Orvane {

// The dialogs that come and go. None of them waits: each calls back, and nothing when its window
// has been closed. Main thread.

/// Shows the dialog, and keeps it until it is answered.
void showUntilAnswered(const std::shared_ptr<Gtk::Dialog>& dialog,
                       std::function<void(int response)> answer = {});

/// Shows what would be moved, and where; the answer is whether to do it.
void askBeforeRemoval(Gtk::Window& parent, const PlannedRemoval& plan,
                      std::function<void(bool)> answer);

/// Tells of something that went wrong.
void showProblem(Gtk::Window& parent, const std::string& title, const std::string& text);

/// Tells that some files were not moved: how many were, and why the first of the others were not.
void showPartlyMoved(Gtk::Window& parent, const std::string& title, const std::string& figures,
                     const std::vector<MoveOutcome::Left>& left);

/// Shows a long text.
void showText(Gtk::Window& parent, const std::string& title, const std::string& text);

/// The files that were not moved and why, a line each.
void showDetails(Gtk::Window& parent, const std::vector<MoveOutcome::Left>& left);

/// Lets the user choose folders.
void chooseFolders(Gtk::Window& parent,
                   std::function<void(const std::vector<std::string>&)> chosen);

/// Lets the user choose a file to write; one that is there only once that was confirmed.
void chooseFile(Gtk::Window& parent, const std::string& suggestedName,
                std::function<void(const std::string&)> chosen);

void showAbout(Gtk::Window& parent);

}  // namespace Orvane
