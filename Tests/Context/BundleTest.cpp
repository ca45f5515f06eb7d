// SPDX-License-Identifier: MIT
#include <Varnel/Context/Bundle.h>

#include <gtest/gtest.h>

#include <Tests/Context/PropertyLists.h>
#include <Tests/Support/TemporaryFolder.h>

namespace Varnel {
namespace {

using Tests::propertyList;

class BundleTest : public testing::Test {
 protected:
  BundleTest() {
    folder_.write("en.lproj/Localizable.strings",
                  propertyList({{"Quit", "Quit"}, {"Only English", "English text"}}));
    folder_.write("de.lproj/Localizable.strings", propertyList({{"Quit", "Beenden"}}));
    folder_.write("de.lproj/Menu.strings", propertyList({{"Quit", "Programm beenden"}}));
    folder_.write("fr.lproj/Localizable.strings", "this is no property list");
  }

  Bundle inLanguages(std::vector<std::string> languages) const {
    return Bundle(folder_.path().string(), std::move(languages));
  }

  Tests::TemporaryFolder folder_;
};

TEST_F(BundleTest, TextsFollowTheUsersLanguagesThenEnglishThenTheKey) {
  const struct {
    std::vector<std::string> languages;
    const char* key;
    const char* text;
  } cases[] = {
      {{"de-AT", "en"}, "Quit", "Beenden"},
      {{"en-GB", "de"}, "Quit", "Quit"},
      {{"tlh", "de"}, "Quit", "Beenden"},
      {{"fr", "de"}, "Quit", "Beenden"},
      {{"tlh"}, "Quit", "Quit"},
      {{"de"}, "Only English", "English text"},
      {{"de"}, "Nowhere", "Nowhere"},
      {{"../de"}, "Nowhere", "Nowhere"},
  };
  for (const auto& [languages, key, text] : cases)
    EXPECT_EQ(inLanguages(languages).localizedString(key), text) << languages.front() << ' ' << key;
  EXPECT_EQ(inLanguages({"de"}).localizedString("Quit", "", "Menu"), "Programm beenden");
  EXPECT_EQ(inLanguages({"de"}).localizedString("Nowhere", "default"), "default");
}

TEST_F(BundleTest, WhatIsMissingOrDamagedIsAbsent) {
  EXPECT_EQ(inLanguages({"en"}).infoDictionary(), nullptr);
  EXPECT_EQ(Bundle(std::nullopt, {"en"}).localizedString("Quit"), "Quit");
  EXPECT_FALSE(Bundle(std::nullopt, {}).url().has_value());
  folder_.write("Info.plist", "<plist><array/></plist>");
  EXPECT_EQ(inLanguages({"en"}).infoDictionary(), nullptr);
  // A folder in the place of a file.
  folder_.write("it.lproj/Localizable.strings/file", "");
  EXPECT_EQ(inLanguages({"it"}).localizedString("Only English"), "English text");
}

TEST_F(BundleTest, ReadsTheInformationDictionary) {
  folder_.write("Info.plist",
                "<plist><dict><key>CFBundleIdentifier</key><string>com.quennel.site.X</string>"
                "<key>CFBundleVersion</key><integer>7</integer></dict></plist>");
  const Bundle bundle = inLanguages({"en"});
  EXPECT_EQ(bundle.identifier(), "com.quennel.site.X");
  EXPECT_EQ(bundle.infoText("CFBundleVersion"), std::nullopt);
}

}  // namespace
}  // namespace Varnel
