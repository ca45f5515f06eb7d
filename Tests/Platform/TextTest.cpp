// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>

#include <limits>
#include <string_view>

#include <Varnel/Platform/Text/ByteCountFormatter.h>
#include <Varnel/Platform/Text/TextFormat.h>
#include <Varnel/Platform/Text/VisibleText.h>
#include <Varnel/Platform/Values/UTF8.h>

namespace Varnel::Platform {
namespace {

using enum ByteCountStyle;

TEST(ByteCountFormatter, RoundsHalvesUpAndCarriesIntoTheNextUnit) {
  constexpr std::int64_t kibi = 1024;
  constexpr std::int64_t least = std::numeric_limits<std::int64_t>::min();
  constexpr std::int64_t greatest = std::numeric_limits<std::int64_t>::max();
  const struct {
    std::int64_t count;
    ByteCountStyle style;
    const char* text;
  } cases[] = {
      {0, memory, "Zero KB"},
      {1, file, "1 byte"},
      {-1, memory, "-1 byte"},
      {999, file, "999 bytes"},
      {1000, decimal, "1 KB"},
      {1000, memory, "1,000 bytes"},
      {-1023, binary, "-1,023 bytes"},
      {1024, memory, "1 KB"},
      {1499, file, "1 KB"},
      {1500, file, "2 KB"},
      {-1500, file, "-2 KB"},
      {1536, memory, "2 KB"},
      {999'499, file, "999 KB"},
      {999'500, file, "1 MB"},
      {999'949'999, decimal, "999.9 MB"},
      {999'950'000, decimal, "1 GB"},
      {1'004'999'999, file, "1 GB"},
      {1'005'000'000, file, "1.01 GB"},
      {2'250'000'000, file, "2.25 GB"},
      {kibi * kibi - 513, memory, "1,023 KB"},
      {kibi * kibi * 1023 + kibi * 512, memory, "1,023.5 MB"},
      {kibi * kibi - 512, memory, "1 MB"},
      {kibi * kibi * kibi * 5 / 4, binary, "1.25 GB"},
      {999'994'999'999'999, file, "999.99 TB"},
      {999'995'000'000'000, file, "1 PB"},
      {greatest, file, "9.22 EB"},
      {greatest, memory, "8 EB"},
      {least, file, "-9.22 EB"},
      {least, binary, "-8 EB"},
  };
  const ByteCountFormatter formatter("en_US");
  for (const auto& [count, style, text] : cases)
    EXPECT_EQ(formatter.string(count, style), text) << count;
}

TEST(ByteCountFormatter, TakesOnlyTheSeparatorsFromTheLocale) {
  const struct {
    const char *locale, *fraction, *grouped;
  } rows[] = {{"", "1.5 MB", "1,023 bytes"},
              {"no such locale", "1.5 MB", "1,023 bytes"},
              {"de_DE.UTF-8", "1,5 MB", "1.023 bytes"},
              {"de_CH", "1.5 MB", "1’023 bytes"},
              {"fr", "1,5 MB", "1\u202F023 bytes"},
              {"fa", "1\u066B5 MB", "1\u066C023 bytes"},
              {"es", "1,5 MB", "1023 bytes"}};  // It groups from five digits on.
  for (const auto& [locale, fraction, grouped] : rows) {
    EXPECT_EQ(ByteCountFormatter(locale).string(1'500'000, file), fraction) << locale;
    EXPECT_EQ(ByteCountFormatter(locale).string(1023, memory), grouped) << locale;
  }
}

TEST(TextFormat, TakesTextsInOrderOrByPosition) {
  EXPECT_EQ(formatted("%@ of %@", {"a", "b"}), "a of b");
  EXPECT_EQ(formatted("%2$@ of %1$@, 100 %%", {"a", "b"}), "b of a, 100 %");
  EXPECT_EQ(formatted("%@ %@ %9$@", {"%@"}), "%@ (null) (null)");
  EXPECT_EQ(formatted("5 % of %d %0$@ %99999999999999999999$@ %1$d %", {"a"}),
            "5 % of %d %0$@ %99999999999999999999$@ %1$d %");
  EXPECT_EQ(formatted("", {"a"}), "");
}

TEST(VisibleText, LeavesTextAloneAndShowsTheRest) {
  const struct {
    std::string_view bytes, shown;
  } cases[] = {
      {"", ""},
      {"plain — ünïcödé 漢字 😀", "plain — ünïcödé 漢字 😀"},
      {"a\nb\tc\r\a\x06\x0e\x1b\x7f", "a\\nb\\tc\\r\\a\\x06\\x0E\\x1B\\x7F"},
      {"back\\slash", "back\\\\slash"},
      {"\xc2\x9bM", "\\xC2\\x9BM"},                       // a control in two bytes
      {"evil\xe2\x80\xaegpj", "evil\\xE2\\x80\\xAEgpj"},  // turns the writing around
      {"line\xe2\x80\xa8", "line\\xE2\\x80\\xA8"},        // a line separator
      {"par\xe2\x80\xa9", "par\\xE2\\x80\\xA9"},          // one of paragraphs
      {"\xff\xfe", "\\xFF\\xFE"},
      {"cut \xe6\xbc", "cut \\xE6\\xBC"},
      {"\xc0\xaf", "\\xC0\\xAF"},  // "/" written too long
      {"\xe0\x80\x80", "\\xE0\\x80\\x80"},
      {"\xed\xa0\x80", "\\xED\\xA0\\x80"},           // half a surrogate pair
      {"\xf4\x90\x80\x80", "\\xF4\\x90\\x80\\x80"},  // beyond the last character
      {"\xc3\xa4\x80", "ä\\x80"},
      {"\xc2\x85\xe2\x81\xa6\xd8\x9c\xef\xbb\xbf",
       "\\xC2\\x85\\xE2\\x81\\xA6\\xD8\\x9C\\xEF\\xBB\\xBF"},
  };
  for (const auto& [bytes, shown] : cases) EXPECT_EQ(visibleText(std::string(bytes)), shown);
  EXPECT_EQ(visibleText(std::string(1, '\0')), "\\x00");
  EXPECT_EQ(visibleText("back\\slash\n", Backslashes::kept), "back\\slash\\n");
}

TEST(UTF8, IsRefusedWhereItIsMalformed) {
  for (const char* text : {"", "plain", "12345678", "12345678ü", "1234567ü", "\U0010FFFF", "é€😀"})
    EXPECT_TRUE(isValidUTF8(text)) << text;
  EXPECT_TRUE(isValidUTF8(std::string_view("a\0ü", 4)));
  for (const char* text : {"\x80", "12345678\xFF", "1234567\xC3", "\xC0\xAF", "\xED\xA0\x80",
                           "\xF4\x90\x80\x80", "\xE2\x82", "ü\xFE"})
    EXPECT_FALSE(isValidUTF8(text)) << text;
}

}  // namespace
}  // namespace Varnel::Platform
