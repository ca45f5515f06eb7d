// SPDX-License-Identifier: MIT
#include <Tests/Contract/UserWorlds.h>

#include <gmock/gmock.h>

#include <algorithm>

#include <Varnel/Platform/Testing/FakeUser.h>

namespace Varnel::Platform::Contract {
namespace {

using ::testing::ElementsAre;

TEST_P(UserLocaleContract, WhoHasChosenNothingReadsEnglish) {
  EXPECT_THAT(world->locale().languages(), ElementsAre("en"));
  EXPECT_EQ(world->locale().identifier(), "en_US");
  EXPECT_EQ(world->locale().numberIdentifier(), "en_US");
}

TEST_P(UserLocaleContract, TheChoiceCountsAtOnceEachPartForItself) {
  const UserLocale& locale = world->locale();
  world->choose({"de_AT", "de", "sr_RS"}, "en_GB", "fr_CH");
  EXPECT_THAT(locale.languages(), ElementsAre("de-AT", "de", "sr-RS"));
  EXPECT_EQ(locale.identifier(), "en_GB");
  EXPECT_EQ(locale.numberIdentifier(), "fr_CH");
  world->choose({"ja_JP"}, "", "de_AT");
  EXPECT_THAT(locale.languages(), ElementsAre("ja-JP"));
  EXPECT_EQ(locale.numberIdentifier(), "de_AT");
}

class FakeWorld final : public UserLocaleWorld {
 public:
  FakeWorld() { choose({}, "", ""); }
  UserLocale& locale() override { return locale_; }
  void choose(const std::vector<std::string>& languages, const std::string& dates,
              const std::string& numbers) override {
    locale_.languageTags = languages;
    for (std::string& tag : locale_.languageTags) std::replace(tag.begin(), tag.end(), '_', '-');
    locale_.localeIdentifier = dates;
    locale_.numberLocaleIdentifier = numbers;
  }

 private:
  Testing::FakeUserLocale locale_;
};

INSTANTIATE_TEST_SUITE_P(Fake, UserLocaleContract, UserLocaleContract::on<FakeWorld>());

}  // namespace
}  // namespace Varnel::Platform::Contract
