// SPDX-License-Identifier: MIT
#include <Varnel/Paths/CommonPathControl.h>

#include <gtest/gtest.h>

#include <functional>
#include <string>
#include <vector>

namespace Varnel {
namespace {

using Control = CommonPathControl;

struct Cell final : Control::PathComponentCell {
  explicit Cell(const char* path) : location(Platform::URL::fileURLWithPath(path)) {}
  Platform::URL url() const override { return location; }
  Platform::URL location;
};

// A view at (100, 50) of the window, with one component in its first ten points.
struct FakeView final : Control::View {
  bool showsPath = true;
  std::shared_ptr<Cell> cell = std::make_shared<Cell>("/home/ada");
  std::shared_ptr<Control::Menu> listMenu = std::make_shared<Control::Menu>();
  std::function<void()> whileMakingMenu = [] {};
  std::vector<std::string> presses;

  void nextResponderMouseDown(const Control::MouseEvent&) override { presses.push_back("next"); }
  void pathControlMouseDown(const Control::MouseEvent&) override { presses.push_back("own"); }
  bool hasPathCell() const override { return showsPath; }
  Control::Point convertedFromWindow(Control::Point location) const override {
    return {location.x - 100, location.y - 50};
  }
  std::shared_ptr<Control::PathComponentCell> pathComponentCellAt(
      Control::Point location) const override {
    return location.x >= 0 && location.x < 10 ? cell : nullptr;
  }
  std::shared_ptr<Control::Menu> documentViewMenu(const Control::MouseEvent&) const override {
    whileMakingMenu();
    return listMenu;
  }
};

TEST(CommonPathControl, OnlyASingleClickSelectsTheRow) {
  FakeView view;
  Control control(view);
  for (const int count : {1, 2, 0, 3, 1}) control.mouseDown({.clickCount = count, .location = {}});
  EXPECT_EQ(view.presses, (std::vector<std::string>{"next", "own", "own", "own", "next"}));
}

TEST(CommonPathControl, TheListsMenuCanReadWhatWasRightClicked) {
  FakeView view;
  Control control(view);
  std::shared_ptr<Control::PathComponentCell> seen;
  view.whileMakingMenu = [&] { seen = control.rightClickedPathComponentCell(); };
  EXPECT_EQ(control.menu({.clickCount = 1, .location = {105, 60}}), view.listMenu);
  EXPECT_EQ(seen, view.cell);

  view.showsPath = false;
  view.listMenu = nullptr;
  EXPECT_EQ(control.menu({.clickCount = 1, .location = {150, 60}}), nullptr);
  EXPECT_EQ(control.rightClickedPathComponentCell(), view.cell);

  view.showsPath = true;
  EXPECT_EQ(control.menu({.clickCount = 1, .location = {150, 60}}), nullptr);
  EXPECT_EQ(control.rightClickedPathComponentCell(), nullptr);
}

}  // namespace
}  // namespace Varnel
