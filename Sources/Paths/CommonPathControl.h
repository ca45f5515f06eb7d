// SPDX-License-Identifier: MIT
#pragma once

#include <memory>
#include <utility>

#include <Varnel/Platform/Api.h>
#include <Varnel/Platform/Values/URL.h>

namespace Varnel {

/// A path shown as a row of components, for use inside a scrolling list: a single click goes
/// through to the list, which selects the row, and the menu of a right click is the list's own.
/// `View` stands for the toolkit:
///
///     class PathRow : public Toolkit::Widget, CommonPathControl::View { … };
///     void PathRow::mousePressed(…) { control.mouseDown({.clickCount = n, .location = p}); }
///
/// Main thread only. The view outlives the control.
class VARNEL_API CommonPathControl final {
 public:
  struct Point {
    double x = 0;
    double y = 0;
  };

  /// A press of a mouse button; the location is in the coordinates of the window.
  struct MouseEvent {
    int clickCount = 0;
    Point location;
  };

  /// The toolkit's picture of one component.
  class PathComponentCell {
   public:
    virtual ~PathComponentCell() = default;
    [[nodiscard]] virtual Platform::URL url() const = 0;
  };

  /// The toolkit's menu, which is passed on unseen.
  class Menu {
   public:
    virtual ~Menu() = default;
  };

  /// The toolkit's view that shows the path.
  class View {
   public:
    virtual ~View() = default;

    /// Passes a press on to the next responder.
    virtual void nextResponderMouseDown(const MouseEvent& event) = 0;
    /// Handles a press as the toolkit's path controls do.
    virtual void pathControlMouseDown(const MouseEvent& event) = 0;

    /// Whether the view shows a path at the moment.
    [[nodiscard]] virtual bool hasPathCell() const = 0;
    /// A point of the window in the view's own coordinates.
    [[nodiscard]] virtual Point convertedFromWindow(Point location) const = 0;
    /// The component at a point within the view's bounds; null between and beside them.
    [[nodiscard]] virtual std::shared_ptr<PathComponentCell> pathComponentCellAt(
        Point location) const = 0;

    /// The menu that the document view of the enclosing scroll view gives for the event; null
    /// without one of the three.
    [[nodiscard]] virtual std::shared_ptr<Menu> documentViewMenu(const MouseEvent& event) const = 0;
  };

  explicit CommonPathControl(View& view) : view_(view) {}
  CommonPathControl(const CommonPathControl&) = delete;
  CommonPathControl& operator=(const CommonPathControl&) = delete;

  /// Exactly one click goes to the next responder, any other count to the path control.
  void mouseDown(const MouseEvent& event);

  /// Notes the component under the event and answers with the menu of the enclosing list, which may
  /// read `rightClickedPathComponentCell()` while it makes the menu. Null for no menu.
  [[nodiscard]] std::shared_ptr<Menu> menu(const MouseEvent& event);

  /// The component that was last right-clicked, if any.
  [[nodiscard]] const std::shared_ptr<PathComponentCell>& rightClickedPathComponentCell() const {
    return rightClickedPathComponentCell_;
  }
  void setRightClickedPathComponentCell(std::shared_ptr<PathComponentCell> cell) {
    rightClickedPathComponentCell_ = std::move(cell);
  }

 private:
  View& view_;
  std::shared_ptr<PathComponentCell> rightClickedPathComponentCell_;
};

}  // namespace Varnel
