// SPDX-License-Identifier: MIT
#include <orvane-window/Interface/Questions.h>

#include <glibmm/main.h>
#include <glibmm/miscutils.h>
#include <gtkmm/aboutdialog.h>
#include <gtkmm/filechooserdialog.h>
#include <gtkmm/messagedialog.h>
#include <gtkmm/scrolledwindow.h>
#include <gtkmm/textview.h>

#include <algorithm>
#include <memory>
#include <utility>

#include <Varnel/Context/Globals.h>
#include <Varnel/Context/TargetKind.h>
#include <Varnel/GTK3/ErrorDialog.h>
#include <Varnel/GTK3/Identifiers.h>
#include <Varnel/GTK3/LongWords.h>
#include <Varnel/Logging/UserErrorInfo.h>
#include <orvane-window/Model/Texts.h>

namespace Orvane {

using Varnel::GTK3::identify;
namespace {

constexpr std::size_t maxLines = 1000;
constexpr std::size_t maxExamples = 3;

std::string linesOf(const std::vector<MoveOutcome::Left>& left, std::size_t max) {
  std::string text;
  for (std::size_t i = 0; i < std::min(left.size(), max); ++i)
    text += (i > 0 ? "\n" : "") + pathText(left[i].path) + ": " + left[i].reason;
  return left.size() > max ? text + "\n…" : text;
}

void addButton(Gtk::Dialog& dialog, const char* textKey, int response,
               const std::string& identifier) {
  identify(*dialog.add_button(localized(textKey), response), identifier);
}

std::shared_ptr<Gtk::FileChooserDialog> fileChooser(Gtk::Window& parent, const char* titleKey,
                                                    Gtk::FileChooserAction action,
                                                    const std::string& identifier,
                                                    const char* acceptKey, const char* acceptName) {
  auto dialog = std::make_shared<Gtk::FileChooserDialog>(
      parent, localized(titleKey), action, Gtk::DIALOG_MODAL | Gtk::DIALOG_USE_HEADER_BAR);
  identify(*dialog, identifier);
  addButton(*dialog, "Cancel", Gtk::RESPONSE_CANCEL, identifier + ".cancel");
  addButton(*dialog, acceptKey, Gtk::RESPONSE_ACCEPT, identifier + acceptName);
  dialog->set_default_response(Gtk::RESPONSE_ACCEPT);
  dialog->set_current_folder(Glib::get_home_dir());
  return dialog;
}

}  // namespace

void showUntilAnswered(const std::shared_ptr<Gtk::Dialog>& dialog,
                       std::function<void(int)> answer) {
  dialog->signal_response().connect(
      [kept = dialog, answer = std::move(answer)](int response) mutable {
        const auto answered = std::exchange(kept, nullptr);
        if (!answered) return;
        answered->hide();
        if (answer) answer(response);
        // Not within its own signal.
        Glib::signal_idle().connect_once([answered] {});
      });
  dialog->show();
}

void askBeforeRemoval(Gtk::Window& parent, const PlannedRemoval& plan,
                      std::function<void(bool)> answer) {
  const auto dialog = std::make_shared<Gtk::MessageDialog>(
      parent, localized("Confirm_Title", {sizeText(plan.bytes())}), false, Gtk::MESSAGE_QUESTION,
      Gtk::BUTTONS_NONE, true);
  std::string text = localized("Confirm_Text", {countText(plan.files())});
  for (const std::string& folder : plan.destinations())
    text += "\n" + localized("Confirm_Destination", {pathText(folder, true)});
  text += "\n" + localized("Confirm_Later");
  const auto left = plan.left();
  if (!left.empty())
    text += "\n\n" + localized("Confirm_Stay", {countText(left.size())}) + "\n" +
            linesOf(left, maxExamples);
  dialog->set_secondary_text(text);
  Varnel::GTK3::breakLongWords(dialog->gobj());
  identify(*dialog, "confirmation");
  addButton(*dialog, "Cancel", Gtk::RESPONSE_CANCEL, "confirmation.cancel");
  addButton(*dialog, "MoveToTrash", Gtk::RESPONSE_ACCEPT, "confirmation.move");
  dialog->get_widget_for_response(Gtk::RESPONSE_ACCEPT)
      ->get_style_context()
      ->add_class("destructive-action");
  dialog->set_response_sensitive(Gtk::RESPONSE_ACCEPT, plan.files() > 0);
  dialog->set_default_response(Gtk::RESPONSE_CANCEL);
  showUntilAnswered(dialog, [answer = std::move(answer)](int response) {
    answer(response == Gtk::RESPONSE_ACCEPT);
  });
}

void showProblem(Gtk::Window& parent, const std::string& title, const std::string& text) {
  Varnel::GTK3::presentError(parent, {title, text, {localized("Close")}});
}

void showPartlyMoved(Gtk::Window& parent, const std::string& title, const std::string& figures,
                     const std::vector<MoveOutcome::Left>& left) {
  Varnel::GTK3::presentError(parent,
                             {title,
                              figures + "\n\n" + linesOf(left, maxExamples),
                              {localized("Details"), localized("Close")}},
                             [&parent, left](auto option) {
                               if (option == 0u) showDetails(parent, left);
                             });
}

void showText(Gtk::Window& parent, const std::string& title, const std::string& text) {
  const auto dialog =
      std::make_shared<Gtk::Dialog>(title, parent, Gtk::DIALOG_MODAL | Gtk::DIALOG_USE_HEADER_BAR);
  dialog->set_default_size(640, 420);
  identify(*dialog, "text");
  auto* scroll = Gtk::manage(new Gtk::ScrolledWindow);
  auto* view = Gtk::manage(new Gtk::TextView);
  view->set_editable(false);
  view->set_wrap_mode(Gtk::WRAP_WORD_CHAR);
  view->set_border_width(12);
  view->get_buffer()->set_text(text);
  scroll->add(*view);
  dialog->get_content_area()->pack_start(*scroll);
  dialog->show_all_children();
  showUntilAnswered(dialog);
}

void showDetails(Gtk::Window& parent, const std::vector<MoveOutcome::Left>& left) {
  showText(parent, localized("Details"), linesOf(left, maxLines));
}

void chooseFolders(Gtk::Window& parent,
                   std::function<void(const std::vector<std::string>&)> chosen) {
  const auto dialog = fileChooser(parent, "ChooseFolders", Gtk::FILE_CHOOSER_ACTION_SELECT_FOLDER,
                                  "choose-folders", "Choose", ".choose");
  dialog->set_select_multiple(true);
  showUntilAnswered(dialog, [dialog = dialog.get(), chosen = std::move(chosen)](int response) {
    if (response != Gtk::RESPONSE_ACCEPT) return;
    const auto names = dialog->get_filenames();
    chosen(std::vector<std::string>(names.begin(), names.end()));
  });
}

void chooseFile(Gtk::Window& parent, const std::string& suggestedName,
                std::function<void(const std::string&)> chosen) {
  const auto dialog = fileChooser(parent, "ExportTitle", Gtk::FILE_CHOOSER_ACTION_SAVE,
                                  "choose-file", "Save", ".save");
  dialog->set_do_overwrite_confirmation();
  dialog->set_current_name(suggestedName);
  showUntilAnswered(dialog, [dialog = dialog.get(), chosen = std::move(chosen)](int response) {
    if (response == Gtk::RESPONSE_ACCEPT && !dialog->get_filename().empty())
      chosen(dialog->get_filename());
  });
}

void showAbout(Gtk::Window& parent) {
  const auto dialog = std::make_shared<Gtk::AboutDialog>();
  dialog->set_transient_for(parent);
  dialog->set_modal(true);
  dialog->set_program_name(Varnel::Globals::applicationName());
  dialog->set_version(Varnel::Globals::applicationVersionString());
  dialog->set_comments(localized("Folders_Title"));
  dialog->set_license_type(Gtk::LICENSE_MIT_X11);
  dialog->set_logo_icon_name(Varnel::TargetKind::current().bundleID());
  identify(*dialog, "about");
  showUntilAnswered(dialog);
}

}  // namespace Orvane
