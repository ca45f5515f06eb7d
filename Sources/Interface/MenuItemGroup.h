// SPDX-License-Identifier: MIT
#pragma once

#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include <Varnel/Basalt/Identifier.h>

namespace Varnel {

/// One menu of the main menu: a base identifier, and items whose identifiers extend it. To write a
/// group down, derive from this and give each item a member:
///
///     struct Edit final : MenuItemGroup {
///       using MenuItemGroup::MenuItemGroup;
///       const Item undo{*this, "undo"};
///     };
///     Edit edit("main-menu.edit");
///     edit.undo();  // "main-menu.edit.undo"
///
/// Any thread once made. Neither copied nor moved: items belong to their group. Compiled into each
/// program that uses it.
class MenuItemGroup {
 public:
  /// An item of a menu. Called, it gives its identifier; empty if the group's base is.
  class Item final {
   public:
    /// Enters the item into its group, behind those made before it. The name must last.
    Item(MenuItemGroup& group, std::string_view name) : group_(group), name_(name) {
      group.items_.push_back(this);
    }
    Item(const Item&) = delete;
    Item& operator=(const Item&) = delete;

    [[nodiscard]] std::string operator()() const {
      return Basalt::identifier(group_.baseIdentifier_, name_);
    }
    [[nodiscard]] std::string_view name() const { return name_; }

   private:
    const MenuItemGroup& group_;
    std::string_view name_;
  };

  explicit MenuItemGroup(std::string baseIdentifier) : baseIdentifier_(std::move(baseIdentifier)) {}
  MenuItemGroup(const MenuItemGroup&) = delete;
  MenuItemGroup& operator=(const MenuItemGroup&) = delete;

  [[nodiscard]] const std::string& baseIdentifier() const { return baseIdentifier_; }

  /// Every item, in the order of the menu.
  [[nodiscard]] const std::vector<const Item*>& items() const { return items_; }

 private:
  std::string baseIdentifier_;
  std::vector<const Item*> items_;
};

}  // namespace Varnel
