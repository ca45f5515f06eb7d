// SPDX-License-Identifier: MIT
#include <Varnel/Paths/CommonPathControl.h>

namespace Varnel {

void CommonPathControl::mouseDown(const MouseEvent& event) {
  if (event.clickCount == 1)
    view_.nextResponderMouseDown(event);
  else
    view_.pathControlMouseDown(event);
}

std::shared_ptr<CommonPathControl::Menu> CommonPathControl::menu(const MouseEvent& event) {
  if (view_.hasPathCell())
    rightClickedPathComponentCell_ =
        view_.pathComponentCellAt(view_.convertedFromWindow(event.location));
  return view_.documentViewMenu(event);
}

}  // namespace Varnel
