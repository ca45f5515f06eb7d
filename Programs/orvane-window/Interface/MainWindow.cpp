// SPDX-License-Identifier: MIT
#include <orvane-window/Interface/MainWindow.h>

#include <gdk/gdkkeysyms.h>
#include <glibmm/fileutils.h>
#include <glibmm/main.h>

#include <Varnel/Context/Globals.h>
#include <Varnel/Context/TargetKind.h>
#include <Varnel/GTK3/BringToFront.h>
#include <Varnel/GTK3/Identifiers.h>
#include <Varnel/Interface/AccessibleAction.h>
#include <orvane-window/Interface/MainMenu.h>
#include <orvane-window/Interface/Questions.h>
#include <orvane-window/Interface/SetAction.h>
#include <orvane-window/Interface/TurnTimes.h>
#include <orvane-window/Model/Preferences.h>
#include <orvane-window/Model/Texts.h>

namespace Orvane {

using Varnel::GTK3::identify;
namespace {

// Figures that change more often cannot be read.
constexpr unsigned refreshInterval = 100;  // Milliseconds.

const char* nameOf(Session::Stage stage) {
  constexpr const char* names[] = {"folders", "scan",        "results", "plan",
                                   "removal", "restoration", "export"};
  return names[static_cast<std::size_t>(stage)];
}

std::string reasonOf(const Loss& loss) {
  return loss.error ? loss.error.message() : localized("Reason_Changed");
}

}  // namespace

MainWindow::MainWindow(Gtk::Application& owner, Session::Ports ports, Application application)
    : application_(std::move(application)),
      session_(ports, [this](Session::Event event) { follow(event); }) {
  set_default_size(980, 640);
  set_title(Varnel::Globals::applicationName());
  identify(*this, "main-window");
  addHeader();
  addActions();
  const auto menus = mainMenu({.features = Varnel::TargetKind::current().userFeatures(std::nullopt),
                               .isDebugMode = Varnel::Globals::isDebugMode()});
  Varnel::GTK3::appendMenus(menuBar_, owner, descriptionsOf(menus));
  addListMenu(owner);
  box_.pack_start(menuBar_, Gtk::PACK_SHRINK);
  pages_.set_transition_type(Gtk::STACK_TRANSITION_TYPE_CROSSFADE);
  pages_.add(folders_, "folders");
  pages_.add(progress_, "progress");
  pages_.add(results_, "results");
  box_.pack_start(pages_);
  add(box_);
  folders_.removed = [this](const std::string& path) { session_.removeFolder(path); };
  DuplicateView& view = results_.view();
  view.toggled = [this](DuplicateList::Place place) {
    tellRefusal(session_.choose(place, !session_.list()->isChosen(place)));
  };
  view.opened = [this](DuplicateList::Place) { openCurrent(); };
  view.moved = [this] {
    results_.showCurrent(session_);
    updateActions();
  };
  takeDrops();
  box_.show_all();
  fillIn();
  follow(Session::Event::startedOver);
}

MainWindow::~MainWindow() {
  clock_.disconnect();
}

void MainWindow::addHeader() {
  header_.set_show_close_button(true);
  const auto add = [](Gtk::Button& button, const char* icon, const char* textKey,
                      const char* action) {
    button.set_image_from_icon_name(icon, Gtk::ICON_SIZE_BUTTON);
    button.set_tooltip_text(localized(textKey));
    button.get_accessible()->set_name(localized(textKey));
    setAction(button, std::string("win.") + action);
    identify(button, Varnel::AccessibleAction(action).buttonIdentifier());
  };
  add(startOver_, "go-previous-symbolic", "StartOver", "start-over");
  add(rescan_, "view-refresh-symbolic", "Rescan", "rescan");
  header_.pack_start(startOver_);
  header_.pack_start(rescan_);
  header_.show_all();
  set_titlebar(header_);
}

void MainWindow::takeDrops() {
  drag_dest_set({Gtk::TargetEntry("text/uri-list")}, Gtk::DEST_DEFAULT_ALL, Gdk::ACTION_COPY);
  signal_drag_data_received().connect([this](const Glib::RefPtr<Gdk::DragContext>&, int, int,
                                             const Gtk::SelectionData& data, guint, guint) {
    std::vector<std::string> folders;
    for (const auto& uri : data.get_uris()) {
      const auto file = Gio::File::create_for_uri(uri);
      if (!file->get_path().empty()) folders.push_back(file->get_path());
    }
    addFolders(folders);
  });
}

void MainWindow::fillIn() {
  for (const std::string& folder : Preferences::lastFolders()) session_.addFolder(folder);
}

bool MainWindow::hasChoices() const {
  return session_.list() && session_.list()->chosen().files > 0;
}

void MainWindow::addFolders(std::vector<std::string> folders) {
  std::erase_if(folders, [](const std::string& path) {
    return !Glib::file_test(path, Glib::FILE_TEST_IS_DIR);
  });
  if (folders.empty() || session_.isAtWork()) return error_bell();
  // Choices that somebody has made stay.
  if (!hasChoices()) session_.startOver();
  for (const std::string& folder : folders) session_.addFolder(folder);
  if (session_.stage() == Session::Stage::choosing)
    folders_.focus();
  else
    results_.outcome().tell(
        localized("Folders_Added", {countText(session_.folders().size())}), Gtk::MESSAGE_INFO,
        {{"outcome.rescan", localized("Rescan"), [this] { activate_action("rescan"); }},
         {"outcome.close", localized("Close"), {}}});
}

void MainWindow::comeForward(const std::optional<std::string>& activationToken) {
  Varnel::GTK3::bringToFront(*this, activationToken);
}

void MainWindow::suggestScan(const std::optional<std::string>& activationToken) {
  if (!hasChoices()) session_.startOver();
  if (session_.folders().empty()) fillIn();
  comeForward(activationToken);
  if (session_.stage() == Session::Stage::choosing) folders_.focus();
}

// The toolkit's own way leads to the buttons of the header first.
bool MainWindow::on_key_press_event(GdkEventKey* event) {
  if (event->keyval == GDK_KEY_F10 && (event->state & gtk_accelerator_get_default_mod_mask()) == 0)
    return menuBar_.get_children().front()->mnemonic_activate(false);
  return Gtk::ApplicationWindow::on_key_press_event(event);
}

void MainWindow::follow(Session::Event event) {
  using Event = Session::Event;
  switch (event) {
    case Event::foldersChanged:
      folders_.showFolders(session_.folders());
      break;
    case Event::started:
      results_.outcome().withdraw();
      if (session_.stage() == Session::Stage::scanning) results_.clear();
      break;
    case Event::scanned:
      showScanned();
      break;
    case Event::scanFailed: {
      const LostPath& lost = session_.outcome().lostFolders.front();
      showProblem(*this, localized("Error_Scan", {pathText(lost.path)}), reasonOf(lost.loss));
      break;
    }
    case Event::startedOver:
    case Event::scanStopped:
      results_.clear();
      folders_.showFolders(session_.folders());
      break;
    case Event::chosen:
      results_.showChosen(session_);
      break;
    case Event::planned:
      confirmRemoval();
      break;
    case Event::removed:
      showMoved("Removed", "NotRemoved", "Error_Remove");
      break;
    case Event::exported:
      if (const auto failure = session_.exportFailure())
        showProblem(*this, localized("Error_Export"), failure.message());
      break;
    case Event::restored:
      showMoved("Restored", "NotRestored", "Error_Restore");
      break;
  }
  showPage();
  updateActions();
}

void MainWindow::showPage() {
  using Stage = Session::Stage;
  const Stage stage = session_.stage();
  TurnTimes::beginPhase(nameOf(stage));
  for (Gtk::Button* button : {&startOver_, &rescan_}) button->set_visible(stage == Stage::results);
  if (session_.isAtWork()) {
    if (!clock_.connected())
      clock_ = Glib::signal_timeout().connect(
          [this] {
            showProgress();
            return true;
          },
          refreshInterval);
    showProgress();
    pages_.set_visible_child(progress_);
    progress_.focus();
    return;
  }
  clock_.disconnect();
  set_title(Varnel::Globals::applicationName());
  header_.set_title(Varnel::Globals::applicationName());
  header_.set_subtitle("");
  const bool isChange = pages_.get_visible_child() == &progress_ || !get_focus();
  if (stage == Stage::choosing) {
    pages_.set_visible_child(folders_);
    if (isChange) folders_.focus();
  } else {
    pages_.set_visible_child(results_);
    if (isChange) results_.focus();
  }
}

void MainWindow::showProgress() {
  const std::string line = progress_.refresh(session_);
  // What task lists show; the header would follow it.
  set_title(line + " – " + Varnel::Globals::applicationName());
  header_.set_title(Varnel::Globals::applicationName());
  header_.set_subtitle(line);
}

void MainWindow::showScanned() {
  static_cast<void>(Preferences::setLastFolders(session_.folders()));
  results_.showList(session_);
  const ScanTotals& totals = session_.outcome().totals;
  const std::uint64_t files = session_.outcome().leftOutFiles();
  std::string warning;
  if (session_.list()->report()->isPartial) warning = localized("Results_Stopped");
  if (files + totals.unreadableFolders > 0)
    warning +=
        (warning.empty() ? "" : " ") +
        localized("Results_LeftOut", {countText(files), countText(totals.unreadableFolders)});
  if (!warning.empty())
    results_.outcome().tell(warning, Gtk::MESSAGE_WARNING,
                            {{"outcome.close", localized("Close"), {}}});
  if (session_.list()->report()->isPartial) return;
  askForConsent();
  application_.scanned(session_);
}

void MainWindow::showMoved(const char* movedKey, const char* leftKey, const char* problemKey) {
  if (session_.list()) results_.showList(session_);
  const MoveOutcome& moved = session_.moved();
  if (!moved.problem.empty()) return showProblem(*this, localized(problemKey), moved.problem);
  std::string text = localized(movedKey, {countText(moved.paths.size()), sizeText(moved.bytes)});
  std::vector<Notice::Answer> answers;
  if (!moved.left.empty()) {
    text += " " + localized(leftKey, {countText(moved.left.size())});
    const std::string titleKey = std::string(problemKey) + (moved.paths.empty() ? "" : "Part");
    showPartlyMoved(*this, localized(titleKey), text, moved.left);
    answers.push_back({"outcome.details", localized("Details"),
                       [this] { showDetails(*this, session_.moved().left); }});
  }
  if (movedKey == std::string_view("Removed")) text += " " + localized("Confirm_Later");
  if (movedKey == std::string_view("Removed") && !moved.paths.empty())
    answers.push_back({"outcome.put-back", localized("PutBack"), [this] { session_.restore(); }});
  answers.push_back({"outcome.close", localized("Close"), {}});
  if (session_.list())
    results_.outcome().tell(text, moved.left.empty() ? Gtk::MESSAGE_INFO : Gtk::MESSAGE_WARNING,
                            answers);
  else if (moved.left.empty())
    showText(*this, localized("PutBack"), text);
  application_.moved(session_);
}

void MainWindow::askForConsent() {
  if (!application_.asksConsent()) return;
  const auto answer = [this](bool isGranted) {
    return [this, isGranted] { application_.consented(isGranted); };
  };
  results_.question().tell(localized("Consent_Question"), Gtk::MESSAGE_QUESTION,
                           {{"consent.no", localized("No"), answer(false)},
                            {"consent.yes", localized("Yes"), answer(true)}});
}

void MainWindow::tellRefusal(DuplicateList::Answer answer) {
  using Answer = DuplicateList::Answer;
  if (answer == Answer::done) return results_.outcome().withdraw();
  error_bell();
  results_.outcome().tell(
      localized(answer == Answer::reference ? "Refused_Reference" : "Refused_LastOfGroup"),
      Gtk::MESSAGE_INFO, {{"outcome.close", localized("Close"), {}}});
}

}  // namespace Orvane
