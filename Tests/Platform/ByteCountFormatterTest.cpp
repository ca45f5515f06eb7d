// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Text/ByteCountFormatter.h>

#include <gtest/gtest.h>

#include <limits>

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
  const auto text = [](const char* locale) {
    return ByteCountFormatter(locale).string(1'500'000, file);
  };
  EXPECT_EQ(text("en_US"), "1.5 MB");
  EXPECT_EQ(text("de"), "1,5 MB");
  EXPECT_EQ(text("de_DE.UTF-8"), "1,5 MB");
  EXPECT_EQ(text("fa"), "1\u066B5 MB");
  EXPECT_EQ(text(""), "1.5 MB");
  EXPECT_EQ(text("no such locale"), "1.5 MB");
  const auto grouped = [](const char* locale) {
    return ByteCountFormatter(locale).string(1023, memory);
  };
  EXPECT_EQ(grouped("de_DE.UTF-8"), "1.023 bytes");
  EXPECT_EQ(grouped("de_CH"), "1’023 bytes");
  EXPECT_EQ(grouped("fr"), "1\u202F023 bytes");
  EXPECT_EQ(grouped("fa"), "1\u066C023 bytes");
  EXPECT_EQ(grouped("es"), "1023 bytes") << "which groups from five digits on";
  EXPECT_EQ(grouped("no such locale"), "1,023 bytes");
}

}  // namespace
}  // namespace Varnel::Platform
