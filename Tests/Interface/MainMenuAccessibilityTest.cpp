// SPDX-License-Identifier: MIT
#include <Varnel/Interface/MainMenuAccessibility.h>

#include <gtest/gtest.h>

#include <set>

#include <Varnel/Interface/AccessibleAction.h>

namespace Varnel {
namespace {

TEST(MainMenuAccessibility, KeepsItsIrregularNames) {
  const MainMenuAccessibility& menu = MainMenuAccessibility::instance();
  EXPECT_EQ(menu.go().goToExactDuplidates(), "main-menu.go.go-to-exact-duplicates");
  EXPECT_EQ(menu.go().goToSimilarDuplidates(), "main-menu.go.go-to-similar-duplicates");
  EXPECT_EQ(menu.go().goToSelectedDuplidates(), "main-menu.go.go-to-selected-duplicates");
  EXPECT_EQ(menu.window().bringAllToFrong(), "main-menu.window.bring-all-to-front");
  EXPECT_EQ(menu.duplicates().putBackAll(), "main-menu.duplicates.putBackAll");
  EXPECT_EQ(menu.edit().actionCopy(), "main-menu.edit.action-copy");
  EXPECT_EQ(menu.edit().delete_(), "main-menu.edit.delete");
}

TEST(MainMenuAccessibility, ListsEveryItemOnceInTheOrderOfTheMenus) {
  const MainMenuAccessibility& menu = MainMenuAccessibility::instance();
  const std::vector<std::string> identifiers = menu.identifiers();
  EXPECT_EQ(std::set(identifiers.begin(), identifiers.end()).size(), identifiers.size());
  std::vector<std::size_t> sizes;
  for (const MenuItemGroup* group : menu.groups()) sizes.push_back(group->items().size());
  EXPECT_EQ(sizes, (std::vector<std::size_t>{11, 6, 8, 5, 6, 7, 4, 7, 7}));
  EXPECT_EQ(identifiers.front(), menu.orvane().about());
  EXPECT_EQ(identifiers.back(), menu.debug().showPhotosCleaningTutorial());
}

TEST(MainMenuAccessibility, ExtendsTheBaseItWasGiven) {
  EXPECT_EQ(MainMenuAccessibility("x").scan().rescan(), "x.scan.rescan");
  EXPECT_EQ(MainMenuAccessibility("x").scan().baseIdentifier(), "x.scan");
  EXPECT_EQ(MainMenuAccessibility("").scan().rescan(), "");
}

TEST(AccessibleAction, NamesItsButtonAndItsMenuItem) {
  EXPECT_EQ(AccessibleAction("remove").buttonIdentifier(), "remove.button");
  EXPECT_EQ(AccessibleAction("remove").menuItemIdentifier(), "remove.menu-item");
}

}  // namespace
}  // namespace Varnel
