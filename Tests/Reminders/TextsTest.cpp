// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>

#include <filesystem>
#include <map>
#include <set>

#include <Varnel/Platform/Ports/ReadFile.h>
#include <Varnel/Platform/Text/StringsTable.h>
#include <Varnel/Platform/Text/TextFormat.h>
#include <Varnel/Reminders/SchedulePeriodOption.h>

namespace Varnel {
namespace {

namespace fs = std::filesystem;

constexpr std::string_view argument = "<argument>";

// Every prefixed literal is a key; one looked up as an argument of `formatted(` is a format.
void addKeys(const std::string& code, std::map<std::string, int>& keys) {
  constexpr std::string_view opening = "\"Varnel_";
  constexpr std::string_view format = "formatted(localized(";
  for (auto at = code.find(opening); at != std::string::npos; at = code.find(opening, at + 1)) {
    const std::string key = code.substr(at + 1, code.find('"', at + 1) - at - 1);
    const bool isFormat = std::string_view(code).substr(0, at).ends_with(format);
    keys[key] = isFormat ? 1 : 0;
  }
}

// The keys that the code looks up, with the number of texts that each puts into its format.
std::map<std::string, int> keysOfTheCode() {
  std::map<std::string, int> keys;
  for (const char* period : {"Never", "Weekly", "Once In Two Weeks", "Monthly",
                             "Once In Three Months", "Once In Six Months", "Annually"})
    keys[period] = 0;
  for (const auto& entry : fs::recursive_directory_iterator(VARNEL_TEST_SOURCES))
    if (entry.path().extension() == ".cpp") addKeys(*Platform::readFile(entry.path()), keys);
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
    const auto table = Platform::parseStringsTable(*Platform::readFile(
        fs::path(VARNEL_TEST_RESOURCES) / (language + ".lproj") / "Localizable.strings"));
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
