// SPDX-License-Identifier: MIT
#include <gtkmm/clipboard.h>

#include <array>
#include <string_view>
#include <utility>

#include <Varnel/GTK3/ListMenu.h>
#include <Varnel/GTK3/OpenURL.h>
#include <Varnel/Interface/MainMenuAccessibility.h>
#include <Varnel/Paths/CommonPathControl.h>
#include <Varnel/Platform/Values/URL.h>
#include <orvane-window/Interface/MainMenu.h>
#include <orvane-window/Interface/MainWindow.h>
#include <orvane-window/Interface/Questions.h>
#include <orvane-window/Model/Preferences.h>
#include <orvane-window/Model/Texts.h>

namespace Orvane {
namespace {

using Stage = Session::Stage;

struct NamedRule {
  std::string_view name;
  KeepRule rule;
};
constexpr std::array rules{
    NamedRule{"oldest", KeepRule::oldest}, NamedRule{"newest", KeepRule::newest},
    NamedRule{"shortest", KeepRule::shortest}, NamedRule{"first-folder", KeepRule::firstFolder}};

}  // namespace

void MainWindow::addAction(const std::string& name, const std::function<void()>& act) {
  actions_[name] = add_action(name, act);
}

void MainWindow::addActions() {
  for (const char* name : {"scan", "rescan"})
    addAction(name, [this] { session_.scan(Preferences::scanRequest()); });
  for (const char* name : {"stop", "stop-scan", "stop-removing"})
    addAction(name, [this] {
      session_.stop();
      updateActions();
    });
  addAction("start-over", [this] { session_.startOver(); });
  addAction("add-folder", [this] { chooseSomeFolders(); });
  addAction("copy", [this] { copyPath(); });
  addAction("expand-all", [this] { results_.view().expandAll(); });
  addAction("collapse-all", [this] { results_.view().collapseAll(); });
  addAction("full-screen", [this] {
    get_window()->get_state() & Gdk::WINDOW_STATE_FULLSCREEN ? unfullscreen() : fullscreen();
  });
  addAction("next-selected", [this] {
    results_.view().goTo(
        session_.list()->nextChosen(results_.view().current().value_or(DuplicateList::Place{})));
  });
  addAction("put-back", [this] { session_.restore(); });
  addAction("remove", [this] { session_.planRemoval(); });
  addAction("toggle", [this] {
    if (const auto place = results_.view().current()) results_.view().toggled(*place);
  });
  addAction("open", [this] { openCurrent(); });
  addAction("minimize", [this] { iconify(); });
  addAction("zoom", [this] { is_maximized() ? unmaximize() : maximize(); });
  addAction("close", [this] { close(); });
  actions_["select"] = Gio::SimpleAction::create("select", Glib::VARIANT_TYPE_STRING);
  actions_["select"]->signal_activate().connect([this](const Glib::VariantBase& rule) {
    select(Glib::VariantBase::cast_dynamic<Glib::Variant<Glib::ustring>>(rule).get());
  });
  Gtk::ApplicationWindow::add_action(actions_["select"]);
  addAction("export-selected", [this] { exportTo(Session::ExportKind::chosenFiles); });
  addAction("export-json", [this] { exportTo(Session::ExportKind::scanReport); });
  addAction("open-folder", [this] {
    if (clickedFolder_) Varnel::GTK3::openURL(*this, *clickedFolder_);
  });
}

void MainWindow::addListMenu(Gtk::Application& owner) {
  const auto& duplicates = Varnel::MainMenuAccessibility::instance().duplicates();
  Varnel::GTK3::appendSections(
      contextMenu_, owner,
      sectionsOf({{duplicates.selectDuplicate() + ".context", "SelectDuplicate", "win.toggle", ""},
                  {duplicates.quickLook() + ".context", "QuickLook", "win.open", ""},
                  {"open-folder.context", "OpenFolder", "win.open-folder", ""},
                  {"copy.context", "CopyPath", "win.copy", "", true}}));
  contextMenu_.attach_to_widget(results_.view());
  Varnel::GTK3::setListMenu(results_.view(), [this](const Varnel::CommonPathControl& path) {
    const auto& clicked = path.rightClickedPathComponentCell();
    clickedFolder_.reset();
    if (clicked)
      clickedFolder_ = clicked->url();
    else if (const auto place = results_.view().current())
      clickedFolder_ = folderOf(session_.list()->file(*place).path);
    actions_.at("open-folder")->set_enabled(clickedFolder_.has_value());
    return &contextMenu_;
  });
}

void MainWindow::updateActions() {
  const Stage stage = session_.stage();
  const bool isRestful = !session_.isAtWork();
  const bool hasGroups = stage == Stage::results && !session_.list()->report()->groups.empty();
  const bool hasRow = hasGroups && results_.view().current();
  const bool hasChosen = hasGroups && session_.list()->chosen().files > 0;
  const bool goesOn = !isRestful && !session_.isStopping();
  const std::pair<const char*, bool> states[] = {
      {"scan", stage == Stage::choosing && !session_.folders().empty()},
      {"rescan", stage == Stage::results},
      {"stop", goesOn && stage != Stage::exporting},
      {"stop-scan", goesOn && stage == Stage::scanning},
      {"stop-removing", goesOn && stage == Stage::removing},
      {"start-over", stage == Stage::results},
      {"add-folder", isRestful},
      {"copy", hasRow},
      {"expand-all", hasGroups},
      {"collapse-all", hasGroups},
      {"next-selected", hasChosen},
      {"put-back", isRestful},
      {"select", hasGroups},
      {"remove", hasChosen},
      {"export-selected", hasChosen},
      {"export-json", hasGroups},
      {"toggle", hasRow},
      {"open", hasRow}};
  for (const auto& state : states) actions_.at(state.first)->set_enabled(state.second);
}

void MainWindow::select(const std::string& rule) {
  results_.outcome().withdraw();
  if (rule == "none") return session_.chooseNothing();
  for (const NamedRule& each : rules)
    if (each.name == rule) session_.choose(each.rule);
}

void MainWindow::openCurrent() {
  const auto place = results_.view().current();
  if (!place) return;
  Varnel::GTK3::openURL(*this,
                        Varnel::Platform::URL::fileURLWithPath(session_.list()->file(*place).path));
}

void MainWindow::copyPath() {
  if (const auto place = results_.view().current())
    Gtk::Clipboard::get()->set_text(plainPath(session_.list()->file(*place).path));
}

void MainWindow::chooseSomeFolders() {
  chooseFolders(*this, [this](const std::vector<std::string>& folders) { addFolders(folders); });
}

void MainWindow::exportTo(Session::ExportKind kind) {
  const char* name = kind == Session::ExportKind::scanReport ? "duplicates.json" : "duplicates.txt";
  chooseFile(*this, name, [this, kind](const std::string& path) { session_.exportTo(path, kind); });
}

void MainWindow::confirmRemoval() {
  const PlannedRemoval* plan = session_.plan();
  if (!plan) return;
  if (!plan->problem().empty()) {
    showProblem(*this, localized("Error_Remove"), plan->problem());
    return session_.forgetPlan();
  }
  askBeforeRemoval(*this, *plan, [this](bool isConfirmed) {
    isConfirmed ? session_.remove() : session_.forgetPlan();
  });
}

}  // namespace Orvane
