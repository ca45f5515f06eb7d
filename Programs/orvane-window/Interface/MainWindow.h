// SPDX-License-Identifier: MIT
#pragma once

#include <giomm/simpleaction.h>
#include <gtkmm/application.h>
#include <gtkmm/applicationwindow.h>
#include <gtkmm/box.h>
#include <gtkmm/button.h>
#include <gtkmm/headerbar.h>
#include <gtkmm/menu.h>
#include <gtkmm/menubar.h>
#include <gtkmm/stack.h>

#include <functional>
#include <map>
#include <optional>
#include <string>
#include <vector>

#include <Varnel/Platform/Values/URL.h>
#include <orvane-window/Interface/FoldersPage.h>
#include <orvane-window/Interface/ProgressPage.h>
#include <orvane-window/Interface/ResultsPage.h>
#include <orvane-window/Model/Session.h>

namespace Orvane {

/// The one window of the application: the session's folders, progress and results, one page each.
/// Main thread.
class MainWindow final : public Gtk::ApplicationWindow {
 public:
  /// What the application does about a session. Each must be set.
  struct Application {
    std::function<void(const Session&)> scanned;
    std::function<void(const Session&)> moved;  ///< Files were removed or put back.
    std::function<bool()> asksConsent;
    std::function<void(bool)> consented;
  };

  /// The ports outlive the window.
  MainWindow(Gtk::Application& owner, Session::Ports ports, Application application);
  ~MainWindow() override;

  /// Takes up folders, from the command line or from another program. Choices that somebody has
  /// made stay; the folders are then for the next scan.
  void addFolders(std::vector<std::string> folders);
  void comeForward(const std::optional<std::string>& activationToken = std::nullopt);
  /// Comes to the front, ready for a scan of the last folders.
  void suggestScan(const std::optional<std::string>& activationToken);

 protected:
  bool on_key_press_event(GdkEventKey* event) override;

 private:
  using Actions = std::map<std::string, Glib::RefPtr<Gio::SimpleAction>>;

  // MainWindow.cpp: what is shown.
  void addHeader();
  void takeDrops();
  void fillIn();
  [[nodiscard]] bool hasChoices() const;
  void follow(Session::Event event);
  void showPage();
  void showProgress();
  void showScanned();
  void showMoved(const char* movedKey, const char* leftKey, const char* problemKey);
  void askForConsent();
  void tellRefusal(DuplicateList::Answer answer);

  // MainWindowActions.cpp: what the user asks for.
  void addActions();
  void addListMenu(Gtk::Application& owner);
  void addAction(const std::string& name, const std::function<void()>& act);
  void updateActions();
  void select(const std::string& rule);
  void openCurrent();
  void copyPath();
  void chooseSomeFolders();
  void confirmRemoval();
  void exportTo(Session::ExportKind kind);

  const Application application_;
  Session session_;  ///< Outlives the pages that show it.
  Gtk::HeaderBar header_;
  Gtk::Button startOver_;
  Gtk::Button rescan_;
  Gtk::Box box_{Gtk::ORIENTATION_VERTICAL};
  Gtk::MenuBar menuBar_;
  Gtk::Menu contextMenu_;
  Gtk::Stack pages_;
  FoldersPage folders_;
  ProgressPage progress_;
  ResultsPage results_;
  Actions actions_;
  std::optional<Varnel::Platform::URL> clickedFolder_;  ///< By the last right click, if any.
  sigc::connection clock_;
};

}  // namespace Orvane
