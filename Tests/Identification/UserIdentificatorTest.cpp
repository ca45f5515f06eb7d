// SPDX-License-Identifier: MIT
#include <Varnel/Identification/User/UserIdentificator.h>

#include <gtest/gtest.h>

#include <Tests/Support/QuarantineDatabase.h>
#include <Varnel/Basalt/Digest.h>
#include <Varnel/Identification/User/IdentifierRules.h>
#include <Varnel/Identification/User/KeptDownloadSource.h>
#include <Varnel/Identification/User/UserIdentificationInfo.h>
#include <Varnel/Platform/Testing/FakePorts.h>

namespace Varnel {
namespace {

using Platform::Cookie;
using Platform::PropertyData;
using Text = std::optional<std::string>;

PropertyData bytes(std::initializer_list<int> values) {
  PropertyData data;
  for (const int value : values) data.push_back(static_cast<std::byte>(value));
  return data;
}

Cookie analyticsCookie(std::string value, std::string domain = ".quennel.example") {
  return {.domain = std::move(domain), .path = "/", .name = "_ga", .value = std::move(value)};
}

class UserIdentificatorTest : public testing::Test {
 protected:
  UserIdentificatorTest() {
    fakes.userAccount.home = fakes.folder;
    fakes.processInfo.mainBundle = "/opt/orvane";
  }

  // The application comes from the last of these downloads.
  void download(const std::string& url) {
    Tests::runSQL(KVQuarantine::systemQuarantinePathV2(fakes.userAccount),
                  "DROP TABLE IF EXISTS LSQuarantineEvent;" + Tests::createQuarantineTable() +
                      Tests::insertDownload("'E'", "'" + url + "'"));
    fakes.extendedAttributes.values[{"/opt/orvane", "com.apple.quarantine"}] =
        "0083;5f3a;Browser;E";
  }

  Platform::Testing::FakePorts fakes;
  const UserIdentificator::Ports ports{fakes.cookieStorage, fakes.machineIdentity,
                                       fakes.userAccount,
                                       KVDownloadSourceTracker::Ports::of(fakes.ports())};
  UserIdentificator user{ports, ".quennel.example"};
};

// Servers know users by these values: a change here is a mistake.
TEST_F(UserIdentificatorTest, TheUserIdentifierNeverChanges) {
  EXPECT_EQ(Basalt::hexadecimal(Basalt::sha256("abc")),
            "ba7816bf8f01cfea414140de5dae2223b00361a396177a9cb410ff61f20015ad");
  EXPECT_EQ(user.userIdentifier(),
            "3a8bc9fb6c605385e50e4f03118cd86b7f59529b27829673810b9854b1a2e6be");
  EXPECT_EQ(userIdentifierOf(std::nullopt, "ada"),
            "a90a92e0a503c5490d0ccf4cadbbd1efdd3c5925d08cc598db2606b8273c88b5");
  EXPECT_EQ(userIdentifierOf("uuid", "\xFF"), "(null)");
  fakes.userAccount.accountName = "grace";
  EXPECT_EQ(user.userIdentifier(),
            "3a8bc9fb6c605385e50e4f03118cd86b7f59529b27829673810b9854b1a2e6be");  // kept
  EXPECT_EQ(userIdentifierOf(user.machineUUID(), "grace").size(), 64U);
  EXPECT_NE(userIdentifierOf(user.machineUUID(), "grace"), user.userIdentifier());
}

TEST_F(UserIdentificatorTest, StoredIdentifiersAreComputedOnceOrAssigned) {
  EXPECT_EQ(user.machineUUID(), "0f1e2d3c4b5a69788796a5b4c3d2e1f0");
  fakes.machineIdentity.properties.clear();
  EXPECT_EQ(user.machineUUID(), "0f1e2d3c4b5a69788796a5b4c3d2e1f0");
  EXPECT_EQ(user.serialNumber(), std::nullopt);
  EXPECT_EQ(user.serialNumber(), std::nullopt);
  EXPECT_EQ(fakes.machineIdentity.questions, 2);

  user.setSerialNumber("S1");
  user.setMachineUUID(std::nullopt);
  EXPECT_EQ(user.serialNumber(), "S1");
  EXPECT_EQ(user.machineUUID(), std::nullopt);
  EXPECT_EQ(user.userIdentifier(), userIdentifierOf(std::nullopt, "ada"));
  user.setUserIdentifier("U1");
  EXPECT_EQ(user.userIdentifier(), "U1");
  EXPECT_EQ(fakes.machineIdentity.questions, 2);
}

TEST_F(UserIdentificatorTest, APropertyThatIsNoTextIsAbsent) {
  fakes.machineIdentity.properties = {{"IOPlatformUUID", bytes({1, 2})},
                                      {"IOPlatformSerialNumber", 5.0}};
  EXPECT_EQ(user.machineUUID(), std::nullopt);
  EXPECT_EQ(user.serialNumber(), std::nullopt);
}

TEST_F(UserIdentificatorTest, TheLastPrimaryAddressIsWrittenInSixBytes) {
  EXPECT_EQ(user.primaryMacAddress(), std::nullopt);
  fakes.machineIdentity.addresses = {bytes({1, 2, 3, 4, 5, 6}),
                                     bytes({0x00, 0x1B, 0x63, 0x84, 0x45, 0xE6})};
  EXPECT_EQ(user.primaryMacAddress(), "00:1b:63:84:45:e6");
  fakes.machineIdentity.addresses.push_back(bytes({0xAB, 0xCD}));
  EXPECT_EQ(user.primaryMacAddress(), "ab:cd:00:00:00:00");
  fakes.machineIdentity.addresses.push_back(bytes({1, 2, 3, 4, 5, 6, 7, 8}));
  EXPECT_EQ(user.primaryMacAddress(), "01:02:03:04:05:06");
}

TEST_F(UserIdentificatorTest, TheDownloadNamesItsCampaign) {
  EXPECT_EQ(user.downloadSourceURLString(), std::nullopt);
  const std::pair<const char*, Text> cases[] = {
      {"https://example.org/a.dmg?lang=de&cid=12.34&cid=5", "12.34"},
      {"https://example.org/a b.dmg?x=ä&cid=1#top", "1"},
      {"https://example.org/a.dmg?CID=1&acid=2&cid1=3", std::nullopt},
      {"https://example.org/a.dmg?cid&cid=2", std::nullopt},
      {"https://example.org/a.dmg?cid=", ""},
      {"https://example.org/a.dmg?cid=%FF&cid=2", std::nullopt},
      {"https://example.org/a.dmg?cid=%C3%A4", "ä"},
      {"https://example.org/a.dmg#?cid=2", std::nullopt},
      {"http://[::1?cid=2", std::nullopt},
      {"?cid=7", "7"},
      {"", std::nullopt},
  };
  for (const auto& [url, cid] : cases) {
    download(url);
    EXPECT_EQ(user.downloadSourceURLString(), url);
    EXPECT_EQ(user.downloadSourceURLCid(), cid) << url;
  }
}

TEST_F(UserIdentificatorTest, TheClientIdentifierIsCutFromTheFirstCookieOfTheDomain) {
  const std::pair<std::vector<Cookie>, Text> cases[] = {
      {{}, std::nullopt},
      {{analyticsCookie("GA1.2.1"), analyticsCookie("GA1.2.2")}, "1"},
      {{analyticsCookie("GA1.2."), analyticsCookie("GA1.2.2")}, std::nullopt},
      {{analyticsCookie("1234567")}, "7"},
      {{analyticsCookie("ääääää7")}, "7"},
      {{analyticsCookie("ääääää")}, std::nullopt},
      {{analyticsCookie("GA1.2.\xFF")}, std::nullopt},
      {{analyticsCookie("GA1.2.1", "quennel.example")}, std::nullopt},
      {{analyticsCookie("GA1.2.1", ".Quennel.example")}, std::nullopt},
      {{analyticsCookie("GA1.2.1", ".quennel.example.org"), analyticsCookie("GA1.2.2")}, "2"},
      {{{".quennel.example", "/", "_GA", "GA1.2.1"}, {".quennel.example", "/", "_gat", "GA1.2.1"}},
       std::nullopt},
  };
  for (const auto& [stored, value] : cases) {
    fakes.cookieStorage.ofGroup["Cookies"] = stored;
    EXPECT_EQ(user.GACookieValue(), value);
  }
  fakes.cookieStorage.own = {analyticsCookie("GA1.2.own")};
  EXPECT_EQ(user.GACookieValue(), std::nullopt);
  fakes.cookieStorage.groups = false;
  EXPECT_EQ(user.GACookieValue(), "own");
}

TEST_F(UserIdentificatorTest, OnlyTheSitesBuildPrefersCampaignAndCookie) {
  // The objects of the test outlive the pointer.
  const std::shared_ptr<UserIdentificationProvider> provider(std::shared_ptr<void>(), &user);
  const UserIdentificationInfo site(provider, {.isSiteVersion = true});
  const UserIdentificationInfo store(provider, {.isAppStoreVersion = true});
  const UserIdentificationInfo marketta(provider, {.isMarkettaVersion = true});
  const std::string identifier = user.userIdentifier();

  EXPECT_EQ(site.uniqueClientIdentifier(), identifier);
  fakes.cookieStorage.ofGroup["Cookies"] = {analyticsCookie("GA1.2.111.222")};
  download("https://example.org/a.dmg");
  EXPECT_EQ(site.uniqueClientIdentifier(), "111.222");
  download("https://example.org/a.dmg?cid=3");
  EXPECT_EQ(site.uniqueClientIdentifier(), "3");
  EXPECT_EQ(store.uniqueClientIdentifier(), identifier);
  EXPECT_EQ(marketta.uniqueClientIdentifier(), identifier);
  EXPECT_EQ(site.identificator(), provider);
}

// A fault may hide an identifier. It makes up none, and what is asked for each time is found again.
TEST_F(UserIdentificatorTest, AFaultHidesAnIdentifierAndChangesNone) {
  using Platform::Testing::Fault;
  fakes.cookieStorage.ofGroup["Cookies"] = {analyticsCookie("GA1.2.111.222")};
  fakes.machineIdentity.addresses = {bytes({1, 2, 3, 4, 5, 6})};
  download("https://example.org/a.dmg?cid=3");
  const auto askedEachTime = [](const UserIdentificator& asked) {
    return std::vector<Text>{asked.primaryMacAddress(), asked.downloadSourceURLString(),
                             asked.downloadSourceURLCid(), asked.GACookieValue()};
  };
  const auto askedOnce = [](const UserIdentificator& asked) {
    return std::vector<Text>{asked.machineUUID(), asked.serialNumber()};
  };
  const auto hides = [](const std::vector<Text>& truth, const std::vector<Text>& answers) {
    for (std::size_t i = 0; i < truth.size(); ++i)
      EXPECT_TRUE(answers[i] == truth[i] || !answers[i]) << *answers[i];
  };
  const auto changing = askedEachTime(user);
  const auto stored = askedOnce(user);
  for (const Fault fault : {Fault::fails, Fault::absent}) {
    const auto calls = sweepFaults(fault, [&](const auto& faults) {
      fakes.cookieStorage.faults = fakes.machineIdentity.faults = fakes.extendedAttributes.faults =
          fakes.volumeCatalog.faults = faults;
      const auto asked = std::make_shared<UserIdentificator>(ports, ".quennel.example");
      hides(changing, askedEachTime(*asked));
      hides(stored, askedOnce(*asked));
      EXPECT_FALSE(
          UserIdentificationInfo(asked, {.isSiteVersion = true}).uniqueClientIdentifier().empty());
      EXPECT_EQ(asked->userIdentifier(), userIdentifierOf(asked->machineUUID(), "ada"));
      faults->mend();
      EXPECT_EQ(askedEachTime(*asked), changing);
    });
    EXPECT_GE(calls, 6u);
  }
}

TEST_F(UserIdentificatorTest, AKeptDownloadIsLookedForOnce) {
  const std::shared_ptr<UserIdentificationProvider> provider(std::shared_ptr<void>(), &user);
  for (const char* url : {"", "https://example.org/a.dmg?cid=3"}) {
    if (*url) download(url);
    const auto kept = std::make_shared<KeptDownloadSource>(provider);
    const Text campaign = kept->downloadSourceURLCid();
    download("https://example.org/a.dmg?cid=4");
    EXPECT_EQ(campaign, *url ? Text("3") : std::nullopt);
    EXPECT_EQ(kept->downloadSourceURLCid(), campaign);
    EXPECT_EQ(kept->downloadSourceURLString(), *url ? Text(url) : std::nullopt);
    EXPECT_EQ(UserIdentificationInfo(kept, {.isSiteVersion = true}).uniqueClientIdentifier(),
              campaign.value_or(user.userIdentifier()));
    EXPECT_EQ(kept->machineUUID(), user.machineUUID());
  }
  EXPECT_EQ(fakes.systemLog.text(), "Failed to open database!\n");
}

}  // namespace
}  // namespace Varnel
