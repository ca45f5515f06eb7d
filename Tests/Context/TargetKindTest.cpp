// SPDX-License-Identifier: MIT
#include <Varnel/Context/TargetKind.h>

#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

#include <Platform/Testing/FakeWorkspace.h>
#include <Varnel/Context/BuildSwitches.h>

namespace Varnel {
namespace {

using Platform::URL;

TEST(TargetKind, FirstSwitchOfTheFixedOrderDecides) {
  EXPECT_EQ(TargetKind::of({.isAppStoreVersion = true, .isSiteVersion = true}),
            TargetKind::appstore);
  EXPECT_EQ(TargetKind::of({.isSiteVersion = true, .isMarkettaVersion = true}), TargetKind::site);
  EXPECT_EQ(TargetKind::of({.isMarkettaVersion = true}), TargetKind::marketta);
  EXPECT_DEATH((void)TargetKind::of({}), "TargetKind:");
}

TEST(TargetKind, IsFoundByItsExactBundleIdentifier) {
  for (const TargetKind kind : TargetKind::allValues())
    EXPECT_EQ(TargetKind::withBundleID(kind.bundleID()), kind);
  EXPECT_EQ(TargetKind::withBundleID("com.quennel.Orvane2"), TargetKind::appstore);
  EXPECT_EQ(TargetKind::withBundleID("com.quennel.orvane2"), std::nullopt);
  EXPECT_EQ(TargetKind::withBundleID(""), std::nullopt);
}

TEST(TargetKind, FindsInstalledChannelsInTheirOrder) {
  Platform::Testing::FakeWorkspace workspace;
  EXPECT_TRUE(TargetKind::findInstalledTargets(workspace).empty());
  const auto install = [&](TargetKind kind) {
    workspace.applications.emplace(kind.bundleID(), URL::fileURLWithPath("/opt/app"));
  };
  install(TargetKind::site);
  EXPECT_TRUE(TargetKind::site.findOtherInstalledTargets(workspace).empty());
  install(TargetKind::appstore);
  EXPECT_EQ(TargetKind::findInstalledTargets(workspace),
            (std::vector{TargetKind::appstore, TargetKind::site}));
}

TEST(TargetKind, AvailabilityIsATruthValueOrAbsent) {
  const auto read = [](const char* json) {
    return TargetKind::site.extractIsAvailable(nlohmann::json::parse(json));
  };
  EXPECT_EQ(read(R"({"isAvailableInSite": true})"), true);
  EXPECT_EQ(read(R"({"isAvailableInSite": "true"})"), std::nullopt);
  EXPECT_EQ(read(R"({"isAvailableInSite": 1})"), std::nullopt);
  EXPECT_EQ(read(R"({"isAvailableInAppStore": true})"), std::nullopt);
  EXPECT_EQ(read(R"(["isAvailableInSite"])"), std::nullopt);
}

TEST(TargetKind, SuggestionsReplaceDefaultsOnlyInTheAppStore) {
  const UserFeatures defaults = {UserFeatures::sharing, UserFeatures::crossPromo,
                                 UserFeatures::achievements, UserFeatures::irate};
  const UserFeatures promo = UserFeatures::cleanResultsPromo;
  EXPECT_EQ(TargetKind::appstore.userFeatures(std::nullopt), UserFeatures());
  EXPECT_EQ(TargetKind::appstore.userFeatures(promo), promo);
  for (const TargetKind kind : {TargetKind::site, TargetKind::marketta}) {
    EXPECT_EQ(kind.userFeatures(std::nullopt), defaults);
    EXPECT_EQ(kind.userFeatures(UserFeatures()), defaults);
    EXPECT_EQ(kind.userFeatures(promo), defaults.union_(promo));
  }
}

}  // namespace
}  // namespace Varnel
