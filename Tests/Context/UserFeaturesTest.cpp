// SPDX-License-Identifier: MIT
#include <Varnel/Context/UserFeatures.h>

#include <gtest/gtest.h>

#include <Varnel/Basalt/JSON.h>
#include <Varnel/Context/UserFeaturesBox.h>

namespace Varnel {
namespace {

using Platform::PropertyList;

static_assert(Basalt::JSONConvertable<UserFeatures>);
static_assert(Basalt::JSONConvertable<UserFeaturesBox>);
static_assert(!std::is_default_constructible_v<UserFeaturesBox>);
static_assert(!std::is_convertible_v<Basalt::JSON, UserFeatures>);

TEST(UserFeatures, HasThePublishedBitsAndNames) {
  const struct {
    UserFeatures member;
    std::int64_t bit;
    const char* name;
    bool (UserFeaturesBox::*property)() const;
    bool whenPresent;
  } rows[] = {
      {UserFeatures::sharing, 1, "sharing", &UserFeaturesBox::isSharingHidden, false},
      {UserFeatures::crossPromo, 2, "cross-promo", &UserFeaturesBox::isLearnMoreHidden, false},
      {UserFeatures::achievements, 4, "achievements", &UserFeaturesBox::isAchievementsHidden,
       false},
      {UserFeatures::irate, 8, "irate", &UserFeaturesBox::isIRateEnabled, true},
      {UserFeatures::cleanResultsPromo, 16, "clean-results-promo",
       &UserFeaturesBox::isCleanResultsPromoHidden, false},
  };
  for (const auto& row : rows) {
    EXPECT_EQ(row.member.rawValue(), row.bit);
    EXPECT_EQ(row.member.exportJSON(), PropertyList{row.name});
    EXPECT_EQ(UserFeatures(PropertyList{row.name}), row.member);
    const UserFeatures others(31 - row.bit);
    EXPECT_EQ(UserFeatures(others.exportJSON()), others);
    EXPECT_EQ(UserFeaturesBox(others), UserFeaturesBox(others));
    EXPECT_EQ((UserFeaturesBox(row.member).*row.property)(), row.whenPresent) << row.name;
    EXPECT_EQ((UserFeaturesBox(others).*row.property)(), !row.whenPresent) << row.name;
    const auto shared = UserFeaturesBox::make(others);
    EXPECT_EQ(shared->copy(), shared);
  }
}

TEST(UserFeatures, ImportsKnownNamesAndSkipsOthers) {
  EXPECT_EQ(UserFeatures(Basalt::parseJSON(R"(["sharing", "irate", "irate"])")).rawValue(), 9);
  EXPECT_TRUE(UserFeatures(Basalt::parseJSON(R"(["from-a-newer-server"])")).isEmpty());
  EXPECT_TRUE(UserFeatures(PropertyList()).isEmpty());
}

TEST(UserFeatures, RefusesAnythingButAListOfStrings) {
  for (const char* text : {"{}", "\"sharing\"", "null", "7", R"(["sharing", 1])", "[[]]"}) {
    try {
      const UserFeatures features(Basalt::parseJSON(text));
      FAIL() << text;
    } catch (const Basalt::JSONError& error) {
      EXPECT_EQ(error.kind(), Basalt::JSONError::Kind::typeMismatch);
      EXPECT_EQ(error.typeName(), "UserFeatures");
      EXPECT_EQ(error.path(), "root");
    }
  }
}

TEST(UserFeatures, FollowsTheAlgebraOfSets) {
  UserFeatures set = {UserFeatures::sharing, UserFeatures::irate};
  EXPECT_FALSE(set.insert(UserFeatures::irate));
  EXPECT_TRUE(set.insert(UserFeatures::crossPromo));
  EXPECT_EQ(set.update(UserFeatures::achievements), std::nullopt);
  EXPECT_EQ(set.remove({UserFeatures::sharing, UserFeatures::cleanResultsPromo}),
            UserFeatures::sharing);
  EXPECT_EQ(set.remove(UserFeatures::sharing), std::nullopt);
  EXPECT_EQ(set.rawValue(), 2 + 4 + 8);
  EXPECT_TRUE(UserFeatures().isStrictSubset(set));
  EXPECT_FALSE(set.isStrictSubset(set));
  EXPECT_TRUE(set.isSuperset(set));
  EXPECT_EQ(set.symmetricDifference(set), UserFeatures());
}

}  // namespace
}  // namespace Varnel
