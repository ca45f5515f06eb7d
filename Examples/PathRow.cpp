// SPDX-License-Identifier: MIT
// A row of a host's own list that shows a path: a click selects the row, a right click asks the
// list for its menu, which knows the component below the mouse. The "toolkit" is the terminal.
#include <iostream>
#include <memory>
#include <string>
#include <vector>

#include <Varnel/Paths/CommonPathControl.h>

using namespace Varnel;

struct Cell final : CommonPathControl::PathComponentCell {
  explicit Cell(const std::string& path) : shown(Platform::URL::fileURLWithPath(path)) {}
  Platform::URL url() const override { return shown; }
  Platform::URL shown;
};

// Each component is ten points wide.
class PathRow final : public CommonPathControl::View {
 public:
  explicit PathRow(const std::vector<std::string>& folders) {
    for (const auto& each : folders) cells_.push_back(std::make_shared<Cell>(each));
  }

  void nextResponderMouseDown(const CommonPathControl::MouseEvent&) override {
    std::cout << "the list selects the row\n";
  }
  void pathControlMouseDown(const CommonPathControl::MouseEvent&) override {
    std::cout << "the path control opens the folder\n";
  }
  bool hasPathCell() const override { return !cells_.empty(); }
  CommonPathControl::Point convertedFromWindow(CommonPathControl::Point location) const override {
    return location;
  }
  std::shared_ptr<CommonPathControl::PathComponentCell> pathComponentCellAt(
      CommonPathControl::Point location) const override {
    const auto index = static_cast<std::size_t>(location.x / 10);
    return index < cells_.size() ? cells_[index] : nullptr;
  }
  std::shared_ptr<CommonPathControl::Menu> documentViewMenu(
      const CommonPathControl::MouseEvent&) const override {
    const auto& cell = control.rightClickedPathComponentCell();
    std::cout << "the list makes a menu for " << (cell ? cell->url().path() : "the row") << '\n';
    return std::make_shared<CommonPathControl::Menu>();
  }

  CommonPathControl control{*this};

 private:
  std::vector<std::shared_ptr<Cell>> cells_;
};

int main() {
  PathRow row({"/", "/home", "/home/ann"});
  row.control.mouseDown({.clickCount = 1, .location = {5, 5}});
  row.control.mouseDown({.clickCount = 2, .location = {5, 5}});
  return row.control.menu({.clickCount = 1, .location = {25, 5}}) ? 0 : 1;
}
