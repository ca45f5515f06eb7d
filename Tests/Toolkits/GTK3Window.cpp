// SPDX-License-Identifier: MIT
// The window that GTK3Test drives through the accessibility bus. It says on standard output what
// was done to it, and runs until it is killed.
#include <Varnel/GTK3/DisplayLabels.h>
#include <Varnel/GTK3/ErrorDialog.h>
#include <Varnel/GTK3/Identifiers.h>
#include <Varnel/GTK3/Menus.h>
#include <Varnel/GTK3/PathControl.h>
#include <Varnel/GTK3/RouterAtStartup.h>
#include <Varnel/Interface/MainMenuAccessibility.h>
#include <Varnel/Logging/UserErrorInfo.h>
#include <gtkmm/application.h>
#include <gtkmm/applicationwindow.h>
#include <gtkmm/box.h>
#include <gtkmm/button.h>
#include <gtkmm/menubar.h>

#include <iostream>

using namespace Varnel;
using Platform::URL;

namespace {

void say(const std::string& text) {
  std::cout << text << std::endl;
}

std::vector<GTK3::MenuDescription> menus() {
  const auto& menu = MainMenuAccessibility::instance();
  using GTK3::MenuEntry;
  return {
      {menu.edit().baseIdentifier(),
       "_Edit",
       {{},
        {MenuEntry{menu.edit().actionCopy(), "_Copy", "win.copy", {"<Primary>c"}}},
        {MenuEntry{
            menu.view().toggleFullScreen(), "_Wide", "win.wide", {}, GTK3::MenuItemKind::toggle}}}},
      {menu.debug().baseIdentifier(), "Debug", {{}}}};
}

void presentFailure(Gtk::Window& window) {
  const UserErrorInfo info("Cannot read \xff<b>", "Try_again.\n" + std::string(250, 'x'),
                           {"One_more", "Leave"});
  GTK3::presentError(window, info, [](auto option) {
    say(option ? "answer " + std::to_string(*option) : "no answer");
  });
}

}  // namespace

int main() {
  auto application = Gtk::Application::create("com.example.GTK3Window");
  const GTK3::RouterAtStartup routing(*application.get(), [](auto&) { say("listens"); });
  application->signal_startup().connect([&] {
    auto* window = new Gtk::ApplicationWindow(application);
    window->add_action("copy", [] { say("copied"); });
    window->add_action_bool(
        "wide", [] { say("widened"); }, true);
    auto* box = Gtk::make_managed<Gtk::Box>(Gtk::ORIENTATION_VERTICAL);
    auto* bar = Gtk::make_managed<Gtk::MenuBar>();
    GTK3::appendMenus(*bar, *application.get(), menus());
    auto* fail = Gtk::make_managed<Gtk::Button>("Fail");
    GTK3::identify(*fail, AccessibleAction("fail"));
    fail->signal_clicked().connect([window] { presentFailure(*window); });
    auto* path = Gtk::make_managed<GTK3::PathControl>();
    path->setURL(URL::fileURLWithPath("/home/ada/\xff cat.jpg"));
    GTK3::identify(*path, "path");
    auto* label = Gtk::make_managed<GTK3::PathLabel>();
    label->setURL(URL::fileURLWithPath("/nowhere/folder/"), GTK3::PathKind::folder);
    GTK3::identify(*label, "folder");
    auto* size = Gtk::make_managed<GTK3::SizeLabel>();
    size->setBytes(1'500'000);
    GTK3::identify(*size, "size");
    for (Gtk::Widget* widget : std::initializer_list<Gtk::Widget*>{bar, fail, path, label, size})
      box->pack_start(*widget, false, false);
    window->add(*box);
    window->show_all();
    say("started");
  });
  application->signal_activate().connect([] {});
  const int status = application->run();
  if (!routing.router()) say("does not listen");
  return status;
}
