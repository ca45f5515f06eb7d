// SPDX-License-Identifier: MIT
// A window of a host outside the framework's tree: a list with a path in each row, and a menu that
// knows the component that was clicked. It says what its first row shows, and ends.
#include <Varnel/GTK3/ListMenu.h>
#include <Varnel/GTK3/PathControl.h>
#include <gtkmm.h>

#include <iostream>

using namespace Varnel;

int main() {
  const auto application = Gtk::Application::create("com.example.WindowHost");
  application->signal_activate().connect([&application] {
    auto* window = new Gtk::ApplicationWindow(application);
    auto* scroll = Gtk::make_managed<Gtk::ScrolledWindow>();
    auto* list = Gtk::make_managed<Gtk::ListBox>();
    auto* menu = Gtk::make_managed<Gtk::Menu>();
    GTK3::setListMenu(*list, [menu](const CommonPathControl& path) {
      return path.rightClickedPathComponentCell() ? menu : nullptr;
    });
    for (const char* folder : {"/nowhere/Pictures/", "/nowhere/Music/"}) {
      auto* row = Gtk::make_managed<GTK3::PathControl>();
      row->setURL(Platform::URL::fileURLWithPath(folder), GTK3::PathKind::folder);
      list->append(*row);
    }
    scroll->add(*list);
    window->add(*scroll);
    window->show_all();
    auto* first = dynamic_cast<Gtk::Bin*>(list->get_row_at_index(0));
    std::cout << "the first row: " << first->get_child()->get_accessible()->get_name() << std::endl;
    Glib::signal_idle().connect_once([&application] { application->quit(); });
  });
  return application->run();
}
