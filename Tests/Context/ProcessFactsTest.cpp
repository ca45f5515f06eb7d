// SPDX-License-Identifier: MIT
#include <Varnel/Context/ProcessFacts.h>

#include <filesystem>

#include <gtest/gtest.h>

#include <Tests/Context/PropertyLists.h>
#include <Tests/Support/TemporaryFolder.h>
#include <Varnel/Context/Globals.h>
#include <Varnel/Platform/POSIX/Adapters.h>
#include <Varnel/Platform/Ports/PrivateFiles.h>
#include <Varnel/Platform/Testing/FakeProcessInfo.h>
#include <Varnel/Platform/Testing/FakeUser.h>
#include <Varnel/Platform/Testing/FakeWorkspace.h>
#include <Varnel/Platform/Testing/SimulatedClock.h>

namespace Varnel {
namespace {

using namespace std::chrono_literals;
using Platform::Date;
using Platform::URL;

constexpr Date launch = std::chrono::sys_days(2016y / 5 / 9);

class ProcessFactsTest : public testing::Test {
 protected:
  ProcessFacts facts(BuildSwitches switches = {}) {
    return ProcessFacts({clock, *privateFiles, process, user, workspace}, std::move(switches));
  }
  ProcessFacts siteFacts() { return facts({.isSiteVersion = true, .appName = "Orvane 2"}); }

  std::string baseIdentifierWith(const std::string& bundleIdentifier) {
    folder.write("Info.plist", Tests::propertyList({{"CFBundleIdentifier", bundleIdentifier}}));
    process.mainBundle = folder.path().string();
    return facts().baseIdentifier();
  }

  Tests::TemporaryFolder folder;
  Platform::Testing::SimulatedClock clock{launch};
  Platform::Testing::FakeProcessInfo process;
  Platform::Testing::FakeUserAccount user;
  Platform::Testing::FakeWorkspace workspace;
  const std::unique_ptr<Platform::PrivateFiles> privateFiles = Platform::POSIX::makePrivateFiles();
};

TEST_F(ProcessFactsTest, EveryChannelSharesTheSuitesBaseIdentifier) {
  EXPECT_EQ(baseIdentifierWith("com.quennel.Orvane2"), "com.quennel.Orvane2");
  EXPECT_EQ(baseIdentifierWith("com.quennel.site.Orvane2"), "com.quennel.Orvane2");
  EXPECT_EQ(baseIdentifierWith("com.quennel.Orvane-marketta"), "com.quennel.Orvane2");
  EXPECT_EQ(baseIdentifierWith("com.quennel.trial.Sweeper"), "com.quennel.Sweeper");
  EXPECT_EQ(baseIdentifierWith(""), "host");
  process.mainBundle.reset();
  EXPECT_EQ(facts().baseIdentifier(), "host");
  EXPECT_EQ(facts().identifier("Scan"), "host.Scan");
  EXPECT_DEATH((void)Globals::identifier(""), "Globals");
}

TEST_F(ProcessFactsTest, SubstitutesEveryDefaultNameByTheBuildsOwn) {
  const ProcessFacts renamed = facts({.appName = "Orvane 2 Pro X"});
  EXPECT_EQ(renamed.substitutingApplicationName("Orvane 2, orvane 2 and Orvane 2"),
            "Orvane 2 Pro X, orvane 2 and Orvane 2 Pro X");
  EXPECT_EQ(renamed.substitutingApplicationName("no name here"), "no name here");
  EXPECT_EQ(renamed.substitutingHtmlApplicationName("<b>Orvane&nbsp;2</b> Orvane 2"),
            "<b>Orvane&nbsp;2&nbsp;Pro&nbsp;X</b> Orvane 2");
}

TEST_F(ProcessFactsTest, DebugWinsOverBetaAndBetaOverTheLaunchDate) {
  const struct {
    bool debug;
    bool beta;
    Date::duration sinceLaunch;
    bool enabled;
  } cases[] = {
      {true, true, -1h, true},    {false, true, 1h, false},  {false, false, -1us, false},
      {false, false, 0us, false}, {false, false, 1us, true},
  };
  for (const auto& [debug, beta, sinceLaunch, enabled] : cases) {
    clock.set(launch + sinceLaunch);
    const ProcessFacts tried = facts({.isPrivateBetaMode = beta, .isDebugMode = debug});
    EXPECT_EQ(tried.isEndUserFeaturesEnabled(), enabled);
    EXPECT_EQ(tried.canUseAllCores(), !debug);
  }
}

TEST_F(ProcessFactsTest, FactsStayWhatTheirFirstReaderSaw) {
  const ProcessFacts first = siteFacts();
  EXPECT_FALSE(first.isTimeHasCome());
  EXPECT_FALSE(first.isSandboxed());
  clock.advance(24h);
  process.environment["APP_SANDBOX_CONTAINER_ID"] = "";
  EXPECT_FALSE(first.isTimeHasCome());
  EXPECT_EQ(first.containerPath(), std::nullopt);

  const ProcessFacts second = siteFacts();
  EXPECT_TRUE(second.isTimeHasCome());
  EXPECT_EQ(second.containerPath(), "/home/ada");
}

TEST_F(ProcessFactsTest, FakeTrashIsMadeOrSilentlyNot) {
  user.home = folder.path().string();
  const ProcessFacts fresh = siteFacts();
  const URL url = fresh.fakeTrashURL();
  EXPECT_EQ(url.path(), user.home + "/Library/Application Support/Orvane 2/FakeTrash");
  EXPECT_EQ(std::filesystem::status(url.path()).permissions(), std::filesystem::perms::owner_all);
  EXPECT_TRUE(std::any_cast<bool>(url.temporaryResourceValue(OVURLIsBookmarkedKey)));

  user.home = folder.write("no folder", "").string();
  const ProcessFacts blocked = siteFacts();
  EXPECT_TRUE(blocked.fakeTrashURL().path().starts_with(user.home));
}

}  // namespace
}  // namespace Varnel
