// SPDX-License-Identifier: MIT
#include <Varnel/Interface/MainMenuAccessibility.h>

#include <Basalt/Identifier.h>

namespace Varnel {

const MainMenuAccessibility& MainMenuAccessibility::instance() {
  static const MainMenuAccessibility& catalogue = *new MainMenuAccessibility("main-menu");
  return catalogue;
}

MainMenuAccessibility::MainMenuAccessibility(std::string baseIdentifier)
    : baseIdentifier_(std::move(baseIdentifier)),
      orvane_(Basalt::identifier(baseIdentifier_, "orvane")),
      scan_(Basalt::identifier(baseIdentifier_, "scan")),
      edit_(Basalt::identifier(baseIdentifier_, "edit")),
      view_(Basalt::identifier(baseIdentifier_, "view")),
      go_(Basalt::identifier(baseIdentifier_, "go")),
      duplicates_(Basalt::identifier(baseIdentifier_, "duplicates")),
      window_(Basalt::identifier(baseIdentifier_, "window")),
      help_(Basalt::identifier(baseIdentifier_, "help")),
      debug_(Basalt::identifier(baseIdentifier_, "debug")) {}

std::array<const MenuItemGroup*, 9> MainMenuAccessibility::groups() const {
  return {&orvane_, &scan_, &edit_, &view_, &go_, &duplicates_, &window_, &help_, &debug_};
}

std::vector<std::string> MainMenuAccessibility::identifiers() const {
  std::vector<std::string> identifiers;
  for (const MenuItemGroup* group : groups())
    for (const MenuItemGroup::Item* item : group->items()) identifiers.push_back((*item)());
  return identifiers;
}

}  // namespace Varnel
