// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>

#include <filesystem>
#include <fstream>
#include <map>
#include <regex>
#include <set>

#include <Platform/Text/StringsTable.h>
#include <Platform/Text/TextFormat.h>
#include <Varnel/Reminders/SchedulePeriodOption.h>

namespace Varnel {
namespace {

namespace fs = std::filesystem;

constexpr std::string_view argument = "<argument>";

std::string bytesOf(const fs::path& file) {
  std::ifstream stream(file, std::ios::binary);
  return {std::istreambuf_iterator<char>(stream), {}};
}

// The keys that the code looks up, with the number of texts that each puts into its format.
std::map<std::string, int> keysOfTheCode() {
  std::map<std::string, int> keys = {{"Never", 0},
                                     {"Weekly", 0},
                                     {"Once In Two Weeks", 0},
                                     {"Monthly", 0},
                                     {"Once In Three Months", 0},
                                     {"Once In Six Months", 0},
                                     {"Annually", 0}};
  const std::regex literal("(formatted\\()?localized(?:String)?\\(\\s*\"(Varnel_\\w+)\"");
  for (const auto& entry : fs::recursive_directory_iterator(VARNEL_TEST_SOURCES)) {
    if (entry.path().extension() != ".cpp") continue;
    const std::string code = bytesOf(entry.path());
    for (std::sregex_iterator match(code.begin(), code.end(), literal), end; match != end; ++match)
      keys[(*match)[2]] = (*match)[1].matched ? 1 : 0;
  }
  return keys;
}

std::set<std::string> languages() {
  std::set<std::string> found;
  for (const auto& entry : fs::directory_iterator(VARNEL_TEST_RESOURCES))
    if (entry.path().extension() == ".lproj") found.insert(entry.path().stem());
  return found;
}

TEST(Texts, EveryLanguageHasEveryKeyWithTheArgumentsThatTheCodeGives) {
  const auto keys = keysOfTheCode();
  EXPECT_EQ(keys.size(), 17u);
  EXPECT_EQ(languages(), (std::set<std::string>{"de", "en", "es", "fr", "ja", "uk"}));
  for (const std::string& language : languages()) {
    const auto table = Platform::parseStringsTable(
        bytesOf(fs::path(VARNEL_TEST_RESOURCES) / (language + ".lproj") / "Localizable.strings"));
    ASSERT_TRUE(table) << language;
    for (const auto& [key, argumentCount] : keys) {
      const auto text = table->find(key);
      ASSERT_NE(text, table->end()) << language << ": " << key;
      EXPECT_NE(text->second, "");
      if (argumentCount == 0) {
        EXPECT_EQ(text->second.find('%'), std::string::npos) << language << ": " << key;
        continue;
      }
      const std::string filled = Platform::formatted(text->second, {argument});
      EXPECT_NE(filled.find(argument), std::string::npos) << language << ": " << key;
      EXPECT_EQ(filled.find("(null)"), std::string::npos) << language << ": " << key;
      EXPECT_EQ(filled.find('%'), std::string::npos) << language << ": " << key;
    }
    EXPECT_EQ(table->size(), keys.size()) << language << " has texts that nobody asks for";
  }
}

}  // namespace
}  // namespace Varnel
