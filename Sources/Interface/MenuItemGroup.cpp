// SPDX-License-Identifier: MIT
#include <Varnel/Interface/MenuItemGroup.h>

#include <Basalt/Identifier.h>

namespace Varnel {

MenuItemGroup::Item::Item(MenuItemGroup& group, std::string_view name)
    : group_(group), name_(name) {
  group.items_.push_back(this);
}

std::string MenuItemGroup::Item::operator()() const {
  return Basalt::identifier(group_.baseIdentifier(), name_);
}

}  // namespace Varnel
