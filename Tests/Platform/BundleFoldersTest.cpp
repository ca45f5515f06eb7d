// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Generic/BundleFolders.h>

#include <gtest/gtest.h>

#include <Tests/Support/TemporaryFolder.h>

namespace Varnel::Platform {
namespace {

TEST(BundleFolders, NearestInfoDictionaryCounts) {
  const Tests::TemporaryFolder folder;
  const auto image = folder.write("opt/app/bin/app", "");
  EXPECT_EQ(findBundleFolder(image, "app"), std::nullopt);
  folder.write("share/app/Info.plist", "");
  EXPECT_EQ(findBundleFolder(image, "app"), folder.path() / "share/app");
  folder.write("opt/app/share/app/Info.plist", "");
  EXPECT_EQ(findBundleFolder(image, "app"), folder.path() / "opt/app/share/app");
  EXPECT_EQ(findBundleFolder(image, "other"), std::nullopt);

  // The application's own, beside it, is not that of a library in the same folder.
  folder.write("opt/app/bin/Info.plist", "");
  EXPECT_EQ(findBundleFolder(image, "app"), folder.path() / "opt/app/bin");
  EXPECT_EQ(findSharedFolder(image, "share/app"), folder.path() / "opt/app/share/app");
  folder.write("opt/data/app-1.0/Info.plist", "");
  EXPECT_EQ(findSharedFolder(image, "data/app-1.0"), folder.path() / "opt/data/app-1.0");
  EXPECT_EQ(findSharedFolder("bin/app", "share/app"), std::nullopt);
}

}  // namespace
}  // namespace Varnel::Platform
