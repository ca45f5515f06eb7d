// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Values/URL.h>

#include <gtest/gtest.h>

namespace Varnel::Platform {
namespace {

TEST(URL, KeepsEveryByteOfAPath) {
  std::string everyByte = "/";
  for (int byte = 1; byte < 256; ++byte) everyByte += static_cast<char>(byte);
  everyByte += "end";
  EXPECT_EQ(URL::fileURLWithPath(everyByte).path(), everyByte);
  EXPECT_EQ(URL::fileURLWithPath("/a%2Fb").path(), "/a%2Fb");
  EXPECT_EQ(URL::fileURLWithPath("relative/file").path(), "relative/file");
  EXPECT_EQ(URL::fileURLWithPath("/a b").absoluteString(), "file:///a%20b");
}

TEST(URL, TellsFoldersByTheTrailingSlashAlone) {
  const URL folder = URL::fileURLWithPath("/usr/");
  EXPECT_TRUE(folder.hasDirectoryPath());
  EXPECT_EQ(folder.path(), "/usr");
  EXPECT_NE(folder, URL::fileURLWithPath("/usr"));
  EXPECT_EQ(URL::fileURLWithPath("/").path(), "/");
  EXPECT_EQ(URL::fileURLWithPath("/").lastPathComponent(), "/");
  EXPECT_FALSE(URL::fileURLWithPath("").hasDirectoryPath());
}

TEST(URL, ExtensionIsWhatFollowsTheLastDotOfAName) {
  const auto extension = [](const char* path) {
    return URL::fileURLWithPath(path).pathExtension();
  };
  EXPECT_EQ(extension("/a/photo.tar.gz"), "gz");
  EXPECT_EQ(extension("/a.d/photo"), "");
  EXPECT_EQ(extension("/a/.profile"), "");
  EXPECT_EQ(extension("/a/photo."), "");
  EXPECT_EQ(extension("/a/Mr. Smith"), "");
  EXPECT_EQ(extension("/a/Pictures.bundle/"), "bundle");
}

TEST(URL, TemporaryValuesFollowLaterCopiesAndNotEquality) {
  URL url = URL::fileURLWithPath("/trash");
  const URL before = url;
  url.setTemporaryResourceValue("isBookmarked", true);
  const URL after = url;
  EXPECT_TRUE(std::any_cast<bool>(after.temporaryResourceValue("isBookmarked")));
  EXPECT_FALSE(before.temporaryResourceValue("isBookmarked").has_value());
  EXPECT_EQ(before, after);
}

}  // namespace
}  // namespace Varnel::Platform
