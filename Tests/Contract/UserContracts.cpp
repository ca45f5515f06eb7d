// SPDX-License-Identifier: MIT
#include <Tests/Contract/UserWorlds.h>

#include <gmock/gmock.h>

#include <algorithm>
#include <utility>

#include <Tests/Support/Zones.h>
#include <Varnel/Platform/Testing/FakeApplicationLauncher.h>
#include <Varnel/Platform/Testing/FakeCookieStorage.h>
#include <Varnel/Platform/Testing/FakeMachineIdentity.h>
#include <Varnel/Platform/Testing/FakeUser.h>
#include <Varnel/Platform/Testing/FakeWorkspace.h>

namespace Varnel::Platform::Contract {
namespace {

using namespace std::chrono;
using namespace std::chrono_literals;
using namespace std::string_literals;
using ::testing::ElementsAre;
using ::testing::IsEmpty;

TEST_P(CookieStorageContract, ListsEachStoreInItsOrderAndNoNameLeadsElsewhere) {
  CookieStorage& storage = world->port();
  EXPECT_TRUE(storage.hasGroupContainers());
  EXPECT_TRUE(storage.cookies().empty());
  EXPECT_TRUE(storage.cookiesOfGroupContainer("group").empty());

  const std::vector<Cookie> own = {{".b.example", "/", "z", "1"},
                                   {"a.example", "/path", "a", "ünïcode \n;"},
                                   {"a.example", "/", "empty", ""}};
  const std::vector<Cookie> shared = {{".b.example", "/", "z", "2"}};
  world->fillOwn(own);
  world->fillGroup("group", shared);
  EXPECT_EQ(storage.cookies(), own);
  EXPECT_EQ(storage.cookiesOfGroupContainer("group"), shared);
  for (const char* name : {"", ".", "..", "other", "/group", "../own", "x/../group"})
    EXPECT_TRUE(storage.cookiesOfGroupContainer(name).empty()) << name;
}

class FakeCookieStorageWorld final
    : public FakeColumn<CookieStorageWorld, Testing::FakeCookieStorage> {
 public:
  void fillOwn(const std::vector<Cookie>& cookies) override { port_.own = cookies; }
  void fillGroup(const std::string& identifier, const std::vector<Cookie>& cookies) override {
    port_.ofGroup[identifier] = cookies;
  }
};
INSTANTIATE_TEST_SUITE_P(Fake, CookieStorageContract, on<FakeCookieStorageWorld>());

TEST_P(MachineIdentityContract, TellsTextsOrNothingUnderExactlyTheirNames) {
  const MachineIdentity& machine = world->port();
  const auto properties = [&] {
    return std::pair(machine.platformProperty("IOPlatformUUID"),
                     machine.platformProperty("IOPlatformSerialNumber"));
  };
  const auto nothing = std::pair(std::optional<PropertyValue>(), std::optional<PropertyValue>());
  EXPECT_EQ(properties(), nothing);
  const PropertyValue uuid = "3d1219c7c4c5404aaa1f6d2a48adfda4";
  const PropertyValue serial = "5CD1234XYZ";
  world->identify(*uuid.as<std::string>(), *serial.as<std::string>());
  EXPECT_EQ(properties(), std::pair(std::optional(uuid), std::optional(serial)));
  EXPECT_EQ(properties(), std::pair(std::optional(uuid), std::optional(serial))) << "each time";
  for (const char* other : {"ioplatformuuid", "UUID", "IOPlatform", ""})
    EXPECT_EQ(machine.platformProperty(other), std::nullopt) << other;
  world->identify("", "");
  EXPECT_EQ(properties(), nothing) << "an empty text is none";
}

TEST_P(MachineIdentityContract, ListsNoInterfaceWithoutAnAddress) {
  const MachineIdentity& machine = world->port();
  EXPECT_THAT(machine.primaryInterfaceAddresses(), IsEmpty());
  const PropertyData address{std::byte{2}, std::byte{0}, std::byte{0},
                             std::byte{0}, std::byte{0}, std::byte{9}};
  world->connect(address);
  EXPECT_THAT(machine.primaryInterfaceAddresses(), ElementsAre(address));
  world->connect({});
  EXPECT_THAT(machine.primaryInterfaceAddresses(), IsEmpty());
}

class FakeMachineIdentityWorld final
    : public FakeColumn<MachineIdentityWorld, Testing::FakeMachineIdentity> {
 public:
  FakeMachineIdentityWorld() { port_.properties.clear(); }
  void identify(const std::string& uuid, const std::string& serial) override {
    port_.properties = {{"IOPlatformUUID", uuid}, {"IOPlatformSerialNumber", serial}};
  }
  void connect(const PropertyData& address) override { port_.addresses = {address}; }
};
INSTANTIATE_TEST_SUITE_P(Fake, MachineIdentityContract, on<FakeMachineIdentityWorld>());

TEST_P(TimeZonesContract, ClocksChangeAtTheMomentOfTheChangeAndBehindItLiesTheNext) {
  const Date newYear = sys_days(2026y / January / 1);
  const Date lastDay = sys_days(2026y / December / 31);
  const struct {
    const char* zone;
    seconds winter, summer;
    Date begin, end;  // Of summer.
  } rows[] = {{"Europe/Berlin", 1h, 2h, sys_days(2026y / March / 29) + 1h,
               sys_days(2026y / October / 25) + 1h},
              {"America/New_York", -5h, -4h, sys_days(2026y / March / 8) + 7h,
               sys_days(2026y / November / 1) + 6h}};
  for (const auto& row : rows) {
    const auto zone = world->port().zone(row.zone);
    const TimeZone::Offset winter{row.winter, false};
    const TimeZone::Offset summer{row.summer, true};
    EXPECT_EQ(zone->offsetAt(newYear), winter);
    EXPECT_EQ(zone->nextChange(newYear), row.begin);
    EXPECT_EQ(zone->nextChange(row.begin - 1us), row.begin);
    EXPECT_EQ(zone->offsetAt(row.begin - 1us), winter);
    EXPECT_EQ(zone->offsetAt(row.begin), summer);
    EXPECT_EQ(zone->nextChange(row.begin), row.end);
    EXPECT_EQ(zone->offsetAt(row.end - 1us), summer);
    EXPECT_EQ(zone->offsetAt(lastDay), winter);
    EXPECT_EQ(zone->nextChange(Date::max()), std::nullopt);
    for (const Date edge : {Date::min(), Date::max()}) EXPECT_LT(zone->offsetAt(edge).fromUTC, 24h);
  }
  const auto tokyo = world->port().zone("Asia/Tokyo");
  EXPECT_EQ(tokyo->offsetAt(newYear), TimeZone::Offset{9h});
  EXPECT_EQ(tokyo->nextChange(newYear), std::nullopt);
}

TEST_P(TimeZonesContract, TheUserIsInAZoneThatIsKnownOrInUTC) {
  const TimeZones& zones = world->port();
  for (const char* zone : {"Asia/Tokyo", "Europe/Berlin"}) {
    world->moveUser(zone);
    EXPECT_EQ(zones.localIdentifier(), zone);
  }
  for (const char* unknown : {"Nowhere/At_All", ""}) {
    world->moveUser(unknown);
    EXPECT_EQ(zones.localIdentifier(), "UTC") << unknown;
    const auto zone = zones.zone(unknown);
    EXPECT_EQ(zone->offsetAt(sys_days(2026y / July / 1)), TimeZone::Offset());
    EXPECT_EQ(zone->nextChange(Date::min()), std::nullopt);
  }
}

class FakeTimeZonesWorld final : public TimeZonesWorld {
 public:
  TimeZones& port() override { return zones_; }
  void moveUser(const std::string& zone) override { zones_.local = zone; }

 private:
  Testing::FakeTimeZones zones_ = Tests::zonesOf2026();
};
INSTANTIATE_TEST_SUITE_P(Fake, TimeZonesContract, on<FakeTimeZonesWorld>());

TEST_P(UserAccountContract, AHomeIsAnAbsolutePathAndTheOneOnRecordStays) {
  const UserAccount& account = world->port();
  const std::string real = account.realHomeFolder();
  EXPECT_TRUE(real.starts_with('/') && (real == "/" || !real.ends_with('/'))) << real;
  EXPECT_FALSE(account.name().empty());
  const std::pair<const char*, std::string> cases[] = {
      {"/moved//", "/moved"}, {"//", "/"},      {"/", "/"}, {"", real},
      {"relative", real},     {"./home", real}, {"~", real}};
  for (const auto& [home, folder] : cases) {
    world->moveHome(home);
    EXPECT_EQ(account.homeFolder(), folder) << home;
    EXPECT_EQ(account.realHomeFolder(), real) << home;
  }
}

class FakeUserAccountWorld final : public FakeColumn<UserAccountWorld, Testing::FakeUserAccount> {
 public:
  void moveHome(const std::string& path) override { port_.home = path; }
};
INSTANTIATE_TEST_SUITE_P(Fake, UserAccountContract, on<FakeUserAccountWorld>());

TEST_P(UserLocaleContract, WhoHasChosenNothingReadsEnglish) {
  EXPECT_THAT(world->port().languages(), ElementsAre("en"));
  EXPECT_EQ(world->port().identifier(), "en_US");
  EXPECT_EQ(world->port().numberIdentifier(), "en_US");
}

TEST_P(UserLocaleContract, TheChoiceCountsAtOnceEachPartForItself) {
  const UserLocale& locale = world->port();
  world->choose({"de_AT", "de", "sr_RS"}, "en_GB", "fr_CH");
  EXPECT_THAT(locale.languages(), ElementsAre("de-AT", "de", "sr-RS"));
  EXPECT_EQ(locale.identifier(), "en_GB");
  EXPECT_EQ(locale.numberIdentifier(), "fr_CH");
  world->choose({"ja_JP"}, "", "de_AT");
  EXPECT_THAT(locale.languages(), ElementsAre("ja-JP"));
  EXPECT_EQ(locale.identifier(), "en_US");
  EXPECT_EQ(locale.numberIdentifier(), "de_AT");
  world->choose({"ja_JP"}, "de_AT", "");
  EXPECT_EQ(locale.numberIdentifier(), "en_US");
}

class FakeUserLocaleWorld final : public FakeColumn<UserLocaleWorld, Testing::FakeUserLocale> {
 public:
  FakeUserLocaleWorld() { choose({}, "", ""); }
  void choose(const std::vector<std::string>& languages, const std::string& dates,
              const std::string& numbers) override {
    port_.languageTags = languages;
    for (std::string& tag : port_.languageTags) std::replace(tag.begin(), tag.end(), '_', '-');
    port_.localeIdentifier = dates;
    port_.numberLocaleIdentifier = numbers;
  }
};
INSTANTIATE_TEST_SUITE_P(Fake, UserLocaleContract, on<FakeUserLocaleWorld>());

TEST_P(WorkspaceContract, FindsWhatIsInstalledAtThatMomentUnderExactlyThisIdentifier) {
  Workspace& workspace = world->port();
  EXPECT_EQ(workspace.applicationURL("com.quennel.Velt"), std::nullopt);
  const URL program = world->install("com.quennel.Velt", false);
  const URL bundle = world->install("com.quennel.Orvane2", true);
  EXPECT_EQ(workspace.applicationURL("com.quennel.Velt"), program);
  EXPECT_EQ(workspace.applicationURL("com.quennel.Orvane2"), bundle);
  EXPECT_TRUE(bundle.hasDirectoryPath());
  for (const char* other : {"com.quennel.velt", "com.quennel.Velt ", "Velt", "com.quennel.*",
                            "./com.quennel.Velt", "com.quennel", ""})
    EXPECT_EQ(workspace.applicationURL(other), std::nullopt) << other;
  world->remove("com.quennel.Velt");
  EXPECT_EQ(workspace.applicationURL("com.quennel.Velt"), std::nullopt);
  EXPECT_EQ(workspace.applicationURL("com.quennel.Orvane2"), bundle);
}

class FakeWorkspaceWorld final : public FakeColumn<WorkspaceWorld, Testing::FakeWorkspace> {
 public:
  FakeWorkspaceWorld() { port_.applications.emplace("", URL::fileURLWithPath("/opt/nobody's")); }
  URL install(const std::string& identifier, bool hasBundle) override {
    const URL url = URL::fileURLWithPath("/opt/" + identifier + (hasBundle ? "/" : ""));
    port_.applications.emplace(identifier, url);
    return url;
  }
  void remove(const std::string& identifier) override { port_.applications.erase(identifier); }
};
INSTANTIATE_TEST_SUITE_P(Fake, WorkspaceContract, on<FakeWorkspaceWorld>());

TEST_P(ApplicationLauncherContract, StartsWhatIsInstalledAndNothingElse) {
  world->install("com.example.Velt", "scan");
  const auto launch = [&](const ApplicationLaunch& what) {
    std::vector<bool> answers;
    world->port().launch(what, [&](const auto& error) { answers.push_back(!error); });
    EXPECT_EQ(answers.size(), 1u) << what.desktopEntry;
    return answers == std::vector{true};
  };
  const ApplicationLaunch whole{"com.example.Velt", "scan", "token"};
  for (const ApplicationLaunch& each : {whole, ApplicationLaunch{"com.example.Velt"},
                                        ApplicationLaunch{"com.example.Velt", "other"}}) {
    ASSERT_TRUE(launch(each));
    const ApplicationLaunch started = world->started();
    EXPECT_EQ(started.desktopEntry, "com.example.Velt");
    EXPECT_EQ(started.action, each.action == "scan" ? "scan" : "");
    EXPECT_EQ(started.activationToken, each.activationToken);
  }
  for (const std::string& other : {std::string(), std::string("com.example.velt"),
                                   std::string("./com.example.Velt"), "com.example.Velt"s + '\0'})
    EXPECT_FALSE(launch({.desktopEntry = other})) << other;
}

class FakeLauncherWorld final
    : public FakeColumn<ApplicationLauncherWorld, Testing::FakeApplicationLauncher> {
 public:
  void install(const std::string& desktopEntry, const std::string& action) override {
    port_.installed[desktopEntry] = {action};
  }
  ApplicationLaunch started() override { return port_.launches.back(); }
};
INSTANTIATE_TEST_SUITE_P(Fake, ApplicationLauncherContract, on<FakeLauncherWorld>());

}  // namespace
}  // namespace Varnel::Platform::Contract
