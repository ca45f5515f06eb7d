// SPDX-License-Identifier: MIT
#include <Varnel/Basalt/Identifier.h>
#include <Varnel/GTK3/ErrorDialog.h>
#include <Varnel/GTK3/Identifiers.h>
#include <Varnel/GTK3/LongWords.h>
#include <Varnel/Logging/UserErrorType.h>
#include <gtkmm/window.h>

#include <memory>
#include <string>
#include <string_view>
#include <utility>

namespace Varnel::GTK3 {
namespace {

constexpr const char* dialogIdentifier = "error-dialog";

void identify(GtkWidget* widget, std::string_view name) {
  GTK3::identify(*Glib::wrap(widget), Basalt::identifier(dialogIdentifier, name));
}

// Sentences may have several lines, other than names of files: only what is not UTF-8 is replaced.
std::string shownSentence(const std::string& text) {
  const std::unique_ptr<char, decltype(&g_free)> valid(
      g_utf8_make_valid(text.data(), static_cast<gssize>(text.size())), &g_free);
  return valid.get();
}

// "_" is a character of a title and marks no mnemonic.
std::string buttonTitle(const std::string& title) {
  std::string doubled;
  for (const char c : shownSentence(title)) doubled += c == '_' ? "__" : std::string(1, c);
  return doubled;
}

void identifyTexts(GtkMessageDialog* dialog) {
  GtkWidget* area = gtk_message_dialog_get_message_area(dialog);
  const std::unique_ptr<GList, decltype(&g_list_free)> labels(
      gtk_container_get_children(GTK_CONTAINER(area)), &g_list_free);
  const GList* label = labels.get();
  for (const char* name : {"description", "suggestion"}) {
    if (!label) return;
    identify(GTK_WIDGET(label->data), name);
    label = label->next;
  }
}

void addButtons(GtkDialog* dialog, const std::vector<std::string>& options) {
  const auto add = [dialog](const std::string& title, std::size_t place, int response) {
    const std::string name = Basalt::identifier(std::to_string(place), "button");
    identify(gtk_dialog_add_button(dialog, title.c_str(), response), name);
  };
  if (options.empty()) add(g_dgettext("gtk30", "_OK"), 0, GTK_RESPONSE_CLOSE);
  for (std::size_t i = 0; i < options.size(); ++i)
    add(buttonTitle(options[i]), i, static_cast<int>(i));
  gtk_dialog_set_default_response(dialog, options.empty() ? GTK_RESPONSE_CLOSE : 0);
}

void respond(GtkDialog* dialog, int response, gpointer kept) noexcept {
  const ErrorAnswer answer = *static_cast<ErrorAnswer*>(kept);  // The dialog takes it along.
  gtk_widget_destroy(GTK_WIDGET(dialog));
  if (!answer) return;
  if (response >= 0)
    answer(static_cast<std::size_t>(response));
  else
    answer(std::nullopt);
}

}  // namespace

void presentError(Gtk::Window& window, const UserErrorInfo& info, ErrorAnswer answer) {
  GtkWidget* dialog = gtk_message_dialog_new(
      window.gobj(), GtkDialogFlags(GTK_DIALOG_MODAL | GTK_DIALOG_DESTROY_WITH_PARENT),
      GTK_MESSAGE_ERROR, GTK_BUTTONS_NONE, "%s", shownSentence(info.errorDescription).c_str());
  if (!info.recoverySuggestion.empty())
    gtk_message_dialog_format_secondary_text(GTK_MESSAGE_DIALOG(dialog), "%s",
                                             shownSentence(info.recoverySuggestion).c_str());
  GTK3::identify(*Glib::wrap(dialog), std::string(dialogIdentifier));
  identifyTexts(GTK_MESSAGE_DIALOG(dialog));
  breakLongWords(GTK_MESSAGE_DIALOG(dialog));
  addButtons(GTK_DIALOG(dialog), info.recoveryOptions);
  g_signal_connect_data(
      dialog, "response", G_CALLBACK(&respond), new ErrorAnswer(std::move(answer)),
      [](gpointer kept, GClosure*) { delete static_cast<ErrorAnswer*>(kept); }, GConnectFlags{});
  gtk_window_present(GTK_WINDOW(dialog));
}

bool presentError(Gtk::Window& window, const UserErrorType& error, ErrorAnswer answer) {
  const auto info = error.userErrorInfo();
  if (!info) return false;
  presentError(window, *info, std::move(answer));
  return true;
}

}  // namespace Varnel::GTK3
