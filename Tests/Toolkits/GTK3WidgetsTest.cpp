// SPDX-License-Identifier: MIT
#include <Varnel/GTK3/ApplicationActivity.h>
#include <Varnel/GTK3/ListMenu.h>
#include <Varnel/GTK3/Menus.h>
#include <Varnel/GTK3/PathColumn.h>
#include <Varnel/GTK3/PathControl.h>
#include <Varnel/Platform/Generic/HostedApplication.h>
#include <gtest/gtest.h>
#include <gtkmm.h>

#include <memory>
#include <optional>
#include <string>
#include <vector>

// What runs here has a screen of its own: see with-window.
namespace Varnel::GTK3 {
namespace {

void settle() {
  while (Gtk::Main::events_pending()) Gtk::Main::iteration();
}

// The events of a mouse, as GTK hands them to a widget. True for what the widget has handled.
bool press(Gtk::Widget& widget, Glib::RefPtr<Gdk::Window> window, GdkEventType type, guint button,
           double x, double y) {
  GdkEvent* event = gdk_event_new(type);
  event->button.window = GDK_WINDOW(g_object_ref(window->gobj()));
  event->button.button = button;
  event->button.x = x;
  event->button.y = y;
  gdk_event_set_device(
      event, gdk_seat_get_pointer(gdk_display_get_default_seat(gdk_display_get_default())));
  const bool isHandled = gtk_widget_event(widget.gobj(), event);
  gdk_event_free(event);
  return isHandled;
}

// A list in a window, that notes which component its menu is made for and what is opened.
struct List {
  explicit List(Gtk::Widget& list) : widget(list) {
    window.set_default_size(500, 100);
    scrolled.add(list);
    window.add(scrolled);
    setListMenu(list, [this](const CommonPathControl& control) {
      const auto& cell = control.rightClickedPathComponentCell();
      clicked.push_back(cell ? cell->url().path() : "none");
      return &menu;
    });
    window.show_all();
    settle();
  }
  void open(const Platform::URL& url) { opened.push_back(url.path()); }

  Gtk::Widget& widget;
  Gtk::Window window;
  Gtk::ScrolledWindow scrolled;
  Gtk::Menu menu;
  std::vector<std::string> clicked;
  std::vector<std::string> opened;
};

using Texts = std::vector<std::string>;

TEST(PathControl, OneClickIsTheRowsTwoOpenAndTheRightOneKnowsTheComponent) {
  Gtk::ListBox rows;
  PathControl path;
  rows.add(path);
  List list(rows);
  path.setURL(Platform::URL::fileURLWithPath("/nowhere/cat.jpg"));
  path.setOpen([&](const Platform::URL& url) { list.open(url); });
  settle();
  const auto window = path.get_window();
  const double start = 4;
  EXPECT_FALSE(press(path, window, GDK_BUTTON_PRESS, 1, start, 5));
  EXPECT_TRUE(press(path, window, GDK_2BUTTON_PRESS, 1, start, 5));
  EXPECT_EQ(list.opened, Texts{"/"});
  EXPECT_TRUE(press(path, window, GDK_BUTTON_PRESS, 3, start, 5));
  EXPECT_TRUE(press(path, window, GDK_BUTTON_PRESS, 3, 480, 5));
  EXPECT_EQ(list.clicked, (Texts{"/", "none"}));
}

TEST(Menus, ASubmenuThatIsChosenUnseenTakesNoClicksFromTheWindow) {
  const auto application =
      Gtk::Application::create("com.example.Menus", Gio::APPLICATION_NON_UNIQUE);
  const MenuEntry choice{
      "choice", "Choice", "", {}, MenuItemKind::command, {{{"one", "One", "app.one"}}}};
  Gtk::Window window;
  Gtk::MenuBar bar;
  appendMenus(bar, *application.get(), {{"menu", "Menu", {{choice}}}});
  window.add(bar);
  window.show_all();
  settle();
  auto* title = dynamic_cast<Gtk::MenuItem*>(bar.get_children().front());
  Gtk::Widget* item = title->get_submenu()->get_children().front();
  EXPECT_TRUE(atk_action_do_action(ATK_ACTION(gtk_widget_get_accessible(item->gobj())), 0));
  settle();
  EXPECT_FALSE(gtk_grab_get_current());
}

struct Columns : Gtk::TreeModel::ColumnRecord {
  Columns() { add(path); }
  Gtk::TreeModelColumn<std::string> path;
};

TEST(PathColumn, ARowIsSelectedByEitherButtonAndItsLastComponentIsKept) {
  const Columns columns;
  const auto model = Gtk::ListStore::create(columns);
  for (const char* path : {"/nowhere/a.jpg", "/elsewhere/b.jpg", ""})
    (*model->append())[columns.path] = path;
  Gtk::TreeView view(model);
  PathColumn paths(view, "Path", [&](const auto& row) -> std::optional<PathColumn::Location> {
    const std::string path = (*row)[columns.path];
    if (path.empty()) return std::nullopt;
    return PathColumn::Location{Platform::URL::fileURLWithPath(path)};
  });
  List list(view);
  paths.setOpen([&](const Platform::URL& url) { list.open(url); });
  const auto rowAt = [&](int row) {
    Gdk::Rectangle area;
    view.get_cell_area(Gtk::TreeModel::Path(std::to_string(row)), paths, area);
    return area.get_y() + area.get_height() / 2.0;
  };
  const auto pressAt = [&](GdkEventType type, guint button, int row, double x) {
    press(view, view.get_bin_window(), type, button, x, rowAt(row));
  };
  // The second press of a double click, behind which that stands, must not reach the row.
  const auto reachesTheRow = [&](double x) {
    view.get_selection()->unselect_all();
    GdkEvent* both = gdk_event_new(GDK_2BUTTON_PRESS);
    both->button.window = GDK_WINDOW(g_object_ref(view.get_bin_window()->gobj()));
    gdk_event_put(both);
    gdk_event_free(both);
    pressAt(GDK_BUTTON_PRESS, 1, 1, x);
    gdk_event_free(gdk_event_get());
    return view.get_selection()->count_selected_rows() == 1;
  };
  EXPECT_FALSE(reachesTheRow(6));
  EXPECT_TRUE(reachesTheRow(480));
  pressAt(GDK_2BUTTON_PRESS, 1, 1, 6);
  EXPECT_EQ(list.opened, Texts{"/"});
  pressAt(GDK_BUTTON_PRESS, 3, 1, 6);
  EXPECT_EQ(view.get_selection()->get_selected_rows().front().to_string(), "1");
  pressAt(GDK_BUTTON_PRESS, 3, 2, 6);
  EXPECT_EQ(view.get_selection()->get_selected_rows().front().to_string(), "2");
  pressAt(GDK_BUTTON_PRESS, 3, 0, 480);
  EXPECT_EQ(list.clicked, (Texts{"/", "none", "none"}));

  gboolean isShown = FALSE;
  g_signal_emit_by_name(view.gobj(), "popup-menu", &isShown);
  EXPECT_TRUE(isShown);
  EXPECT_EQ(list.clicked.back(), "none");
}

TEST(PathCell, ALongPathLosesItsStart) {
  Gtk::Window window;
  PathCell cell;
  cell.setURL(Platform::URL::fileURLWithPath("/nowhere/in/the/middle/of/cat.jpg"));
  const int full = cell.fullWidth(window);
  const auto firstAt = [&](int width) {
    const auto component = cell.componentAt(window, width, 1);
    return component ? component->url().path() : "none";
  };
  EXPECT_EQ(firstAt(full), "/");
  EXPECT_TRUE(firstAt(full / 2).starts_with("/nowhere/")) << firstAt(full / 2);
  EXPECT_EQ(firstAt(30), "/nowhere/in/the/middle/of/cat.jpg");
  EXPECT_EQ(cell.componentAt(window, full, full + 5), nullptr);
  // However narrow, it takes one line.
  int heights[2][2];
  cell.get_preferred_height(window, heights[0][0], heights[0][1]);
  cell.get_preferred_height_for_width(window, 30, heights[1][0], heights[1][1]);
  EXPECT_EQ(heights[1][1], heights[0][1]);
}

TEST(ApplicationActivity, AChangeBetweenTheApplicationsWindowsIsNone) {
  Platform::HostedApplication application;
  std::vector<bool> told;
  application.setObserver([&](bool isActive) { told.push_back(isActive); });
  auto activity = std::make_unique<ApplicationActivity>(application);
  Gtk::Window window;
  Gtk::Dialog dialog("", window);
  window.show();
  dialog.show();
  settle();
  const auto focus = [](Gtk::Widget& widget, bool isIn) {
    GdkEvent* event = gdk_event_new(GDK_FOCUS_CHANGE);
    event->focus_change.window = GDK_WINDOW(g_object_ref(widget.get_window()->gobj()));
    event->focus_change.in = isIn;
    gtk_widget_event(widget.gobj(), event);
    gdk_event_free(event);
  };
  focus(window, true);
  settle();
  focus(window, false);
  focus(dialog, true);
  settle();
  focus(dialog, false);
  settle();
  EXPECT_EQ(told, (std::vector{false, true, false}));
  focus(window, true);
  settle();
  activity.reset();
  EXPECT_FALSE(application.isActive());
}

}  // namespace
}  // namespace Varnel::GTK3

int main(int count, char** arguments) {
  testing::InitGoogleTest(&count, arguments);
  Gtk::Main gtk(count, arguments);
  return RUN_ALL_TESTS();
}
