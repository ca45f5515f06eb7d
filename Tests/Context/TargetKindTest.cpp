// SPDX-License-Identifier: MIT
#include <Varnel/Context/TargetKind.h>

#include <gtest/gtest.h>
#include <unistd.h>

#include <csignal>

#include <Varnel/Context/BuildSwitches.h>
#include <Varnel/Platform/Testing/FakeWorkspace.h>

namespace Varnel {
namespace {

using Platform::URL;

TEST(TargetKind, HasThePublishedValues) {
  const struct {
    TargetKind kind;
    int rawValue;
    std::string bundleID;
    const char* availability;
    bool hasUpdater;
    std::int64_t features;
  } rows[] = {
      {TargetKind::appstore, 0, "com.quennel.Orvane2", "isAvailableInAppStore", false, 0},
      {TargetKind::marketta, 1, "com.quennel.Orvane-marketta", "isAvailableInMarketta", false, 15},
      {TargetKind::site, 2, "com.quennel.site.Orvane2", "isAvailableInSite", true, 15},
  };
  std::size_t index = 0;
  for (const auto& row : rows) {
    EXPECT_EQ(TargetKind::allValues().at(index++), row.kind);
    EXPECT_EQ(row.kind.rawValue(), row.rawValue);
    EXPECT_EQ(row.kind.bundleID(), row.bundleID);
    EXPECT_EQ(TargetKind::withBundleID(row.bundleID), row.kind);
    EXPECT_EQ(row.kind.hasUpdater(), row.hasUpdater);
    EXPECT_EQ(row.kind.extractIsAvailable(Platform::PropertyDictionary{{row.availability, true}}),
              true);
    EXPECT_EQ(row.kind.defaultUserFeatures().rawValue(), row.features);
  }
  EXPECT_EQ(TargetKind::withBundleID("com.quennel.orvane2"), std::nullopt);
}

TEST(TargetKind, FirstSwitchOfTheFixedOrderDecides) {
  EXPECT_EQ(TargetKind::of({.isAppStoreVersion = true, .isSiteVersion = true}),
            TargetKind::appstore);
  EXPECT_EQ(TargetKind::of({.isSiteVersion = true, .isMarkettaVersion = true}), TargetKind::site);
  EXPECT_EQ(TargetKind::of({.isMarkettaVersion = true}), TargetKind::marketta);
  EXPECT_DEATH((void)TargetKind::of({}), "TargetKind:");
  const auto stopUnheard = [] {
    ::close(STDERR_FILENO);
    (void)TargetKind::of({});
  };
  EXPECT_EXIT(stopUnheard(), testing::KilledBySignal(SIGABRT), "");
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
    return TargetKind::site.extractIsAvailable(Basalt::parseJSON(json));
  };
  EXPECT_EQ(read(R"({"isAvailableInSite": true})"), true);
  EXPECT_EQ(read(R"({"isAvailableInSite": "true"})"), std::nullopt);
  EXPECT_EQ(read(R"({"isAvailableInSite": 1})"), std::nullopt);
  EXPECT_EQ(read(R"({"isAvailableInAppStore": true})"), std::nullopt);
  EXPECT_EQ(read(R"(["isAvailableInSite"])"), std::nullopt);
}

TEST(TargetKind, SuggestionsReplaceDefaultsOnlyInTheAppStore) {
  const UserFeatures defaults(std::int64_t{15});
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
