// SPDX-License-Identifier: MIT
#include <Varnel/Context/UserFeatures.h>

#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

#include <Basalt/JSON.h>
#include <Varnel/Context/UserFeaturesBox.h>

namespace Varnel {
namespace {

using nlohmann::json;

static_assert(Basalt::JSONConvertable<UserFeatures>);
static_assert(Basalt::JSONConvertable<UserFeaturesBox>);
static_assert(!std::is_default_constructible_v<UserFeaturesBox>);

TEST(UserFeatures, ImportsKnownNamesAndSkipsOthers) {
  EXPECT_EQ(UserFeatures(json::parse(R"(["sharing", "irate", "irate"])")).rawValue(), 9);
  EXPECT_TRUE(UserFeatures(json::parse(R"(["from-a-newer-server"])")).isEmpty());
  EXPECT_TRUE(UserFeatures(json::array()).isEmpty());
}

TEST(UserFeatures, RefusesAnythingButAListOfStrings) {
  for (const char* text : {"{}", "\"sharing\"", "null", "7", R"(["sharing", 1])", "[[]]"}) {
    try {
      const UserFeatures features(json::parse(text));
      FAIL() << text;
    } catch (const Basalt::JSONError& error) {
      EXPECT_EQ(error.kind(), Basalt::JSONError::Kind::typeMismatch);
      EXPECT_EQ(error.typeName(), "UserFeatures");
      EXPECT_EQ(error.path(), "root");
    }
  }
}

TEST(UserFeatures, ExportOfAnySetReadsBackAsThatSet) {
  EXPECT_EQ(UserFeatures(std::int64_t{16}).exportJSON(), json::parse(R"(["clean-results-promo"])"));
  for (std::int64_t raw = 0; raw < 32; ++raw) {
    const UserFeatures features(raw);
    EXPECT_EQ(UserFeatures(features.exportJSON()), features);
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

TEST(UserFeaturesBox, FourPropertiesAskWhatIsHiddenAndOneWhatIsEnabled) {
  const UserFeaturesBox box(UserFeatures(std::int64_t{9}));
  EXPECT_FALSE(box.isSharingHidden());
  EXPECT_TRUE(box.isIRateEnabled());
  EXPECT_TRUE(box.isLearnMoreHidden() && box.isAchievementsHidden() &&
              box.isCleanResultsPromoHidden());
  EXPECT_EQ(box, UserFeaturesBox(UserFeatures(std::int64_t{9})));

  const auto shared = UserFeaturesBox::make(UserFeatures());
  EXPECT_EQ(shared->copy(), shared);
  EXPECT_FALSE(shared->isIRateEnabled());
}

}  // namespace
}  // namespace Varnel
