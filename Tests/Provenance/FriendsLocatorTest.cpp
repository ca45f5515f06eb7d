// SPDX-License-Identifier: MIT
#include <Varnel/Provenance/OVFriendsLocator.h>

#include <gtest/gtest.h>

#include <set>

#include <Varnel/Platform/Testing/FakeWorkspace.h>

namespace Varnel {
namespace {

using Platform::URL;

struct Question {
  const char* name;
  bool (*ask)();
};

const Question questions[] = {
    {"Kelvane", OVFriendsLocator::isKelvaneInstalled},
    {"KelvaneClassic", OVFriendsLocator::isKelvaneClassicInstalled},
    {"Kelvane2", OVFriendsLocator::isKelvane2Installed},
    {"Kelvane3", OVFriendsLocator::isKelvane3Installed},
    {"Orvane1", OVFriendsLocator::isOrvane1Installed},
    {"Orvane1MAS", OVFriendsLocator::isOrvane1MASInstalled},
    {"Orvane1Site", OVFriendsLocator::isOrvane1SiteInstalled},
    {"Orvane2", OVFriendsLocator::isOrvane2Installed},
    {"Velt", OVFriendsLocator::isVeltInstalled},
    {"VeltMAS", OVFriendsLocator::isVeltMASInstalled},
    {"VeltSite", OVFriendsLocator::isVeltSiteInstalled},
    {"Drumlin", OVFriendsLocator::isDrumlinInstalled},
    {"Bramble", OVFriendsLocator::isBrambleInstalled},
};

TEST(FriendsLocator, EachProductAnswersForItselfAndItsFamily) {
  const std::pair<const char*, std::set<std::string>> cases[] = {
      {"com.quennel.Kelvane", {"Kelvane", "KelvaneClassic"}},
      {"com.quennel.Kelvane2", {"Kelvane", "Kelvane2"}},
      {"com.quennel.Kelvane3", {"Kelvane", "Kelvane3"}},
      {"com.quennel.Orvane", {"Orvane1", "Orvane1MAS"}},
      {"com.quennel.site.Orvane", {"Orvane1", "Orvane1Site"}},
      {"com.quennel.Orvane2", {"Orvane2"}},
      {"com.quennel.Velt2", {"Velt", "VeltMAS"}},
      {"com.quennel.trial.Velt2", {"Velt", "VeltSite"}},
      {"com.quennel.site.Velt2", {"Velt", "VeltSite"}},
      {"com.quennel.Drumlin", {"Drumlin"}},
      {"com.quennel.Bramble", {"Bramble"}},
      {"com.quennel.Velt", {}},
  };
  const auto workspace = std::make_shared<Platform::Testing::FakeWorkspace>();
  OVFriendsLocator::sharedLocator().setWorkspace(workspace);
  for (const auto& [installed, expected] : cases) {
    workspace->applications = {{installed, URL::fileURLWithPath("/opt/app")}};
    std::set<std::string> yes;
    for (const Question& question : questions)
      if (question.ask()) yes.insert(question.name);
    EXPECT_EQ(yes, expected) << installed;
  }
}

}  // namespace
}  // namespace Varnel
