// SPDX-License-Identifier: MIT
#include <orvane-window/Interface/ResultsPage.h>

#include <giomm/menu.h>
#include <gtkmm/image.h>

#include <Varnel/GTK3/Identifiers.h>
#include <Varnel/Interface/AccessibleAction.h>
#include <orvane-window/Interface/SetAction.h>
#include <orvane-window/Model/Session.h>
#include <orvane-window/Model/Texts.h>

namespace Orvane {

using Varnel::GTK3::identify;
namespace {

Glib::RefPtr<Gio::Menu> ruleMenu() {
  const auto rules = Gio::Menu::create();
  for (const auto& [name, key] :
       {std::pair("oldest", "Keep_Oldest"), std::pair("newest", "Keep_Newest"),
        std::pair("shortest", "Keep_Shortest"), std::pair("first-folder", "Keep_FirstFolder")})
    rules->append(localized(key), std::string("win.select('") + name + "')");
  const auto none = Gio::Menu::create();
  none->append(localized("SelectNone"), "win.select('none')");
  const auto menu = Gio::Menu::create();
  menu->append_section(rules);
  menu->append_section(none);
  return menu;
}

}  // namespace

Notice::Notice(const std::string& identifier) {
  text_.set_line_wrap(true);
  text_.set_xalign(0);
  identify(text_, identifier + ".text");
  static_cast<Gtk::Container*>(get_content_area())->add(text_);
  text_.show();
  set_show_close_button(false);
  set_no_show_all(true);
  signal_response().connect([this](int number) {
    hide();
    const auto index = static_cast<std::size_t>(number);
    // The answer may show the next notice.
    const auto answers = answers_;
    if (number >= 0 && index < answers.size() && answers[index].chosen) answers[index].chosen();
  });
}

void Notice::tell(const std::string& text, Gtk::MessageType type,
                  const std::vector<Answer>& answers) {
  auto* area = static_cast<Gtk::Container*>(get_action_area());
  for (Gtk::Widget* button : area->get_children()) area->remove(*button);
  answers_ = answers;
  for (std::size_t i = 0; i < answers.size(); ++i)
    identify(*add_button(answers[i].text, static_cast<int>(i)), answers[i].identifier);
  text_.set_text(text);
  set_message_type(type);
  show();
}

ResultsPage::ResultsPage() : Gtk::Box(Gtk::ORIENTATION_VERTICAL) {
  addHead();
  pack_start(outcome_, Gtk::PACK_SHRINK);
  pack_start(question_, Gtk::PACK_SHRINK);
  scroll_.set_policy(Gtk::POLICY_AUTOMATIC, Gtk::POLICY_ALWAYS);
  scroll_.set_can_focus(false);
  scroll_.add(view_);
  identify(view_, "duplicates");
  auto* icon = Gtk::manage(new Gtk::Image);
  icon->set_from_icon_name("object-select-symbolic", Gtk::ICON_SIZE_DIALOG);
  icon->set_pixel_size(96);
  icon->get_style_context()->add_class("dim-label");
  auto* title = Gtk::manage(new Gtk::Label(localized("Results_None")));
  title->get_style_context()->add_class("orvane-title");
  noneDetail_.get_style_context()->add_class("dim-label");
  none_.set_valign(Gtk::ALIGN_CENTER);
  for (Gtk::Widget* widget : std::initializer_list<Gtk::Widget*>{icon, title, &noneDetail_})
    none_.pack_start(*widget, Gtk::PACK_SHRINK);
  body_.add(scroll_, "list");
  body_.add(none_, "none");
  pack_start(body_);
  addFoot();
  show_all();
}

void ResultsPage::addHead() {
  head_.set_border_width(12);
  for (Gtk::Label* label : {&title_, &detail_}) {
    label->set_xalign(0);
    label->set_ellipsize(Pango::ELLIPSIZE_END);
    summary_.pack_start(*label, Gtk::PACK_SHRINK);
  }
  title_.get_style_context()->add_class("orvane-title");
  detail_.get_style_context()->add_class("dim-label");
  identify(title_, "results.title");
  identify(detail_, "results.detail");
  select_.set_menu_model(ruleMenu());
  select_.set_label(localized("Select"));
  select_.set_always_show_image(true);
  select_.set_image_from_icon_name("pan-down-symbolic");
  select_.set_image_position(Gtk::POS_RIGHT);
  select_.set_valign(Gtk::ALIGN_CENTER);
  identify(select_, Varnel::AccessibleAction("select").buttonIdentifier());
  head_.pack_start(summary_);
  head_.pack_start(select_, Gtk::PACK_SHRINK);
  pack_start(head_, Gtk::PACK_SHRINK);
}

void ResultsPage::addFoot() {
  path_.set_margin_start(12);
  path_.set_margin_end(12);
  path_.set_margin_top(6);
  path_.set_margin_bottom(6);
  identify(path_, "results.path");
  pack_start(path_, Gtk::PACK_SHRINK);
  identify(chosen_, "results.chosen");
  remove_.set_label(localized("Remove"));
  setAction(remove_, "win.remove");
  remove_.get_style_context()->add_class("destructive-action");
  identify(remove_, Varnel::AccessibleAction("remove").buttonIdentifier());
  chosen_.set_margin_start(6);
  foot_.pack_start(chosen_);
  foot_.pack_end(remove_);
  pack_start(foot_, Gtk::PACK_SHRINK);
}

void ResultsPage::showList(const Session& session) {
  const auto shown = session.list();
  const DuplicateList& list = *shown;
  const bool isEmpty = list.report()->groups.empty();
  const std::string files = countText(session.outcome().lookedAtFiles());
  title_.set_text(localized("Results_Title", {sizeText(list.duplicates().bytes)}));
  detail_.set_text(localized("Results_Detail", {countText(list.report()->groups.size()),
                                                countText(list.duplicates().files), files}));
  noneDetail_.set_text(localized("Results_NoneDetail", {files}));
  view_.showList(shown);
  head_.set_visible(!isEmpty);
  foot_.set_visible(!isEmpty);
  body_.set_visible_child(isEmpty ? "none" : "list");
  showChosen(session);
  showCurrent(session);
}

void ResultsPage::showCurrent(const Session& session) {
  const auto current = view_.current();
  path_.set_visible(current.has_value());
  if (current)
    path_.setURL(Varnel::Platform::URL::fileURLWithPath(session.list()->file(*current).path));
}

void ResultsPage::showChosen(const Session& session) {
  const auto chosen = session.list()->chosen();
  chosen_.set_text(chosen.files == 0
                       ? localized("SelectedNone")
                       : localized("Selected", {countText(chosen.files), sizeText(chosen.bytes)}));
  view_.refresh();
}

}  // namespace Orvane
