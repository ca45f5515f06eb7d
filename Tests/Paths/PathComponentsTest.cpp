// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Values/PathComponents.h>

#include <gtest/gtest.h>

namespace Varnel::Platform {
namespace {

TEST(PathComponents, SplitAtRunsOfSlashesAndKeepTheOutermost) {
  const std::pair<const char*, PathComponents> cases[] = {
      {"", {}},
      {"/", {"/"}},
      {"///", {"/"}},
      {"/a//b", {"/", "a", "b"}},
      {"//a/b//", {"/", "a", "b", "/"}},
      {"a/", {"a", "/"}},
      {"./a/../b", {".", "a", "..", "b"}},
      {"~/", {"~", "/"}},
  };
  for (const auto& [path, components] : cases) EXPECT_EQ(pathComponents(path), components) << path;
  EXPECT_EQ(pathComponents(URL::fileURLWithPath("/a/b//")), (PathComponents{"/", "a", "b"}));
  EXPECT_EQ(pathComponents(URL::fileURLWithPath("/")), PathComponents{"/"});
  EXPECT_EQ(pathComponents(URL::fileURLWithPath("")), PathComponents{});
}

TEST(PathComponents, JoinWithOneSlashAndNoneAtTheEnd) {
  const std::pair<PathComponents, const char*> cases[] = {
      {{}, ""},
      {{"/"}, "/"},
      {{"/", "/"}, "/"},
      {{"/", "a", "b", "/"}, "/a/b"},
      {{"~", "/"}, "~"},
      {{"~", "/", "x"}, "~/x"},
      {{"a", "", "b//c/"}, "a/b/c"},
      {{"", "a"}, "a"},
  };
  for (const auto& [components, path] : cases) EXPECT_EQ(joinPathComponents(components), path);
}

}  // namespace
}  // namespace Varnel::Platform
