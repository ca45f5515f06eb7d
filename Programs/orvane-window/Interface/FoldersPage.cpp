// SPDX-License-Identifier: MIT
#include <orvane-window/Interface/FoldersPage.h>

#include <Varnel/GTK3/Identifiers.h>
#include <Varnel/Interface/AccessibleAction.h>
#include <orvane-window/Interface/SetAction.h>
#include <orvane-window/Model/Texts.h>

namespace Orvane {

using Varnel::GTK3::identify;
namespace {

constexpr int width = 520;

}  // namespace

FoldersPage::FoldersPage()
    : Gtk::Box(Gtk::ORIENTATION_VERTICAL, 12),
      title_(localized("Folders_Title")),
      hint_(localized("Folders_Hint")),
      add_(localized("AddFolder")),
      scan_(localized("ScanButton")) {
  set_valign(Gtk::ALIGN_CENTER);
  set_halign(Gtk::ALIGN_CENTER);
  set_border_width(24);
  icon_.set_from_icon_name("folder-saved-search-symbolic", Gtk::ICON_SIZE_DIALOG);
  icon_.set_pixel_size(96);
  icon_.get_style_context()->add_class("dim-label");
  title_.get_style_context()->add_class("orvane-title");
  hint_.get_style_context()->add_class("dim-label");
  hint_.set_line_wrap(true);
  hint_.set_max_width_chars(60);
  hint_.set_justify(Gtk::JUSTIFY_CENTER);
  list_.set_selection_mode(Gtk::SELECTION_NONE);
  scroll_.set_policy(Gtk::POLICY_NEVER, Gtk::POLICY_AUTOMATIC);
  scroll_.set_propagate_natural_height(true);
  scroll_.set_max_content_height(260);
  scroll_.set_can_focus(false);
  scroll_.add(list_);
  frame_.add(scroll_);
  frame_.set_size_request(width, -1);
  identify(list_, "folders");
  list_.get_accessible()->set_name(localized("Column_Folder"));
  setAction(add_, "win.add-folder");
  setAction(scan_, "win.scan");
  scan_.get_style_context()->add_class("suggested-action");
  identify(add_, Varnel::AccessibleAction("add-folder").buttonIdentifier());
  identify(scan_, Varnel::AccessibleAction("scan").buttonIdentifier());
  for (Gtk::Button* button : {&add_, &scan_}) {
    button->set_size_request(160, -1);
    buttons_.pack_start(*button);
  }
  buttons_.set_halign(Gtk::ALIGN_CENTER);
  buttons_.set_margin_top(12);
  for (Gtk::Widget* widget :
       std::initializer_list<Gtk::Widget*>{&icon_, &title_, &hint_, &frame_, &buttons_})
    pack_start(*widget, Gtk::PACK_SHRINK);
  show_all();
}

void FoldersPage::showFolders(const std::vector<std::string>& folders) {
  for (Gtk::Widget* row : list_.get_children()) list_.remove(*row);
  for (const std::string& folder : folders) addRow(folder);
  frame_.set_visible(!folders.empty());
  scan_.set_visible(!folders.empty());
}

void FoldersPage::addRow(const std::string& folder) {
  auto* row = Gtk::manage(new Gtk::Box(Gtk::ORIENTATION_HORIZONTAL, 10));
  auto* icon = Gtk::manage(new Gtk::Image);
  icon->set_from_icon_name("folder", Gtk::ICON_SIZE_LARGE_TOOLBAR);
  const std::string text = pathText(folder, true);
  auto* label = Gtk::manage(new Gtk::Label(text));
  label->set_xalign(0);
  label->set_ellipsize(Pango::ELLIPSIZE_MIDDLE);
  label->set_tooltip_text(text);
  auto* remove = Gtk::manage(new Gtk::Button);
  remove->set_image_from_icon_name("list-remove-symbolic", Gtk::ICON_SIZE_BUTTON);
  remove->set_relief(Gtk::RELIEF_NONE);
  remove->set_tooltip_text(localized("Folders_Remove"));
  remove->get_accessible()->set_name(localized("Folders_Remove") + ": " + text);
  remove->signal_clicked().connect([this, folder] { removed(std::string(folder)); });
  const std::string number = std::to_string(list_.get_children().size() + 1);
  identify(*remove, Varnel::AccessibleAction("remove-folder." + number).buttonIdentifier());
  row->set_border_width(6);
  row->pack_start(*icon, Gtk::PACK_SHRINK);
  row->pack_start(*label);
  row->pack_start(*remove, Gtk::PACK_SHRINK);
  list_.append(*row);
  row->get_parent()->get_accessible()->set_name(text);
  row->get_parent()->show_all();
}

void FoldersPage::focus() {
  (scan_.get_visible() ? scan_ : add_).grab_focus();
}

}  // namespace Orvane
