// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>

#include <Varnel/Basalt/Identifier.h>
#include <Varnel/Basalt/Version.h>

namespace Basalt {
namespace {

TEST(Identifier, NeedsBothSides) {
  EXPECT_EQ(identifier("com.quennel.Orvane2", "Scan"), "com.quennel.Orvane2.Scan");
  EXPECT_EQ(identifier("", "Scan"), "");
  EXPECT_EQ(identifier("com.quennel.Orvane2", ""), "");
}

TEST(Identifier, LosesOneWholeChannelComponentThatIsNotTheProduct) {
  EXPECT_EQ(withoutChannelComponent("com.quennel.trial.site.Other"), "com.quennel.site.Other");
  EXPECT_EQ(withoutChannelComponent("com.website.Other"), "com.website.Other");
  EXPECT_EQ(withoutChannelComponent("com.quennel.site"), "com.quennel.site");
  EXPECT_EQ(withoutChannelComponent(""), "");
}

TEST(Version, ComparesByNumberNotByText) {
  EXPECT_LT(Version("1.9"), Version("1.10"));
  EXPECT_LT(Version("1.9.9"), Version("2"));
  EXPECT_EQ(Version("1.0.0"), Version("1"));
  EXPECT_EQ(Version("2.1b3 (7)").string(), "2.1");
  EXPECT_EQ(Version("beta"), Version("0"));
  EXPECT_EQ(Version("99999999999.1").component(1), 1u);
}

}  // namespace
}  // namespace Basalt
