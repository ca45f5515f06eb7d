// SPDX-License-Identifier: MIT
#include <atspi/atspi.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <functional>
#include <string>

#include <Tests/Support/ChildProcess.h>

// What runs here has a session bus, a screen and an accessibility bus of its own: see with-window.
// The window is another process, as it is for a screen reader.
namespace Varnel {
namespace {

using ::testing::HasSubstr;
using ::testing::StartsWith;

template <typename Object>
using Held = std::unique_ptr<Object, decltype(&g_object_unref)>;

Held<AtspiAccessible> hold(AtspiAccessible* object) {
  return {object, &g_object_unref};
}

using Predicate = std::function<bool(AtspiAccessible*)>;

Held<AtspiAccessible> search(AtspiAccessible* from, const Predicate& is) {
  if (is(from)) return hold(ATSPI_ACCESSIBLE(g_object_ref(from)));
  const int count = atspi_accessible_get_child_count(from, nullptr);
  for (int i = 0; i < count; ++i)
    if (const auto child = hold(atspi_accessible_get_child_at_index(from, i, nullptr)); child)
      if (auto found = search(child.get(), is)) return found;
  return hold(nullptr);
}

std::string take(char* text) {
  std::string taken = text ? text : "";
  g_free(text);
  return taken;
}

class Window : public testing::Test {
 protected:
  Window() {
    EXPECT_EQ(process_.readLine(), "listens");
    EXPECT_EQ(process_.readLine(), "started");
  }

  // The bus tells of a new window or dialog a moment later.
  static Held<AtspiAccessible> find(const std::string& identifier) {
    const auto hasIdentifier = [&](AtspiAccessible* object) {
      return take(atspi_accessible_get_accessible_id(object, nullptr)) == identifier;
    };
    const auto deadline = g_get_monotonic_time() + 20 * G_USEC_PER_SEC;
    while (g_get_monotonic_time() < deadline) {
      const auto desktop = hold(atspi_get_desktop(0));
      atspi_accessible_clear_cache(desktop.get());
      if (auto found = search(desktop.get(), hasIdentifier)) return found;
      g_main_context_iteration(nullptr, FALSE);
    }
    ADD_FAILURE() << identifier << " is not on the bus";
    return hold(nullptr);
  }

  static std::string nameOf(const std::string& identifier) {
    const auto object = find(identifier);
    return object ? take(atspi_accessible_get_name(object.get(), nullptr)) : "";
  }

  static void click(const std::string& identifier) {
    const auto object = find(identifier);
    ASSERT_TRUE(object);
    AtspiAction* action = atspi_accessible_get_action_iface(object.get());
    ASSERT_TRUE(action) << identifier;
    EXPECT_TRUE(atspi_action_do_action(action, 0, nullptr)) << identifier;
    g_object_unref(action);
  }

  static int widthOf(const std::string& identifier) {
    const auto object = find(identifier);
    AtspiRect* area = atspi_component_get_extents(ATSPI_COMPONENT(object.get()),
                                                  ATSPI_COORD_TYPE_SCREEN, nullptr);
    const int width = area->width;
    g_free(area);
    return width;
  }

  static bool isChecked(const std::string& identifier) {
    const auto object = find(identifier);
    AtspiStateSet* states = atspi_accessible_get_state_set(object.get());
    const bool is = atspi_state_set_contains(states, ATSPI_STATE_CHECKED);
    g_object_unref(states);
    return is;
  }

  Tests::ChildProcess process_{{VARNEL_GTK3_WINDOW}};
};

TEST_F(Window, MenuItemsAreFoundByTheirIdentifierAndDoTheirAction) {
  EXPECT_EQ(nameOf("main-menu.edit"), "Edit");
  EXPECT_EQ(nameOf("main-menu.edit.action-copy"), "Copy");
  EXPECT_TRUE(isChecked("main-menu.view.toggle-full-screen"));
  click("main-menu.edit.action-copy");
  EXPECT_EQ(process_.readLine(), "copied");
}

TEST_F(Window, ASecondInstanceHandsOverAndNeverListens) {
  Tests::ChildProcess second({VARNEL_GTK3_WINDOW});
  EXPECT_EQ(second.readAll(), "does not listen\n");
  EXPECT_EQ(second.wait(), 0);
}

TEST_F(Window, PathsAndSizesAreReadAloudInTheirShortForm) {
  EXPECT_EQ(nameOf("path"), "/home/ada/\\xFF cat.jpg");
  EXPECT_EQ(nameOf("folder"), "/nowhere/folder/");
  EXPECT_EQ(nameOf("size"), "1.5 MB");
}

TEST_F(Window, AnErrorsDialogShowsItsTextsAndTellsTheOptionThatWasChosen) {
  click("fail.button");
  EXPECT_THAT(nameOf("error-dialog.description"), HasSubstr("Cannot read \xef\xbf\xbd<b>"));
  EXPECT_THAT(nameOf("error-dialog.suggestion"), StartsWith("Try_again."));
  EXPECT_LT(widthOf("error-dialog"), 800);  // The name of a file may be longer than a line.
  EXPECT_EQ(nameOf("error-dialog.0.button"), "One_more");
  click("error-dialog.1.button");
  EXPECT_EQ(process_.readLine(), "answer 1");
}

}  // namespace
}  // namespace Varnel

int main(int count, char** arguments) {
  testing::InitGoogleMock(&count, arguments);
  atspi_init();
  return RUN_ALL_TESTS();
}
