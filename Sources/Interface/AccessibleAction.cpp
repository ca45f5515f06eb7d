// SPDX-License-Identifier: MIT
#include <Varnel/Interface/AccessibleAction.h>

#include <Varnel/Basalt/Identifier.h>

namespace Varnel {

std::string AccessibleAction::buttonIdentifier() const {
  return Basalt::identifier(identifier_, "button");
}

std::string AccessibleAction::menuItemIdentifier() const {
  return Basalt::identifier(identifier_, "menu-item");
}

}  // namespace Varnel
