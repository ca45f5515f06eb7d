// SPDX-License-Identifier: MIT
#include <Varnel/Basalt/FuzzyByteCountFormatter.h>

#include <gtest/gtest.h>

#include <limits>
#include <set>

namespace Basalt {
namespace {

using enum Varnel::Platform::ByteCountStyle;

TEST(FuzzyByteCountFormatter, RoundsUpToAFewFigures) {
  const FuzzyByteCountFormatter formatter("de_DE");
  EXPECT_EQ(formatter.string(0, file), "Zero KB");
  EXPECT_EQ(formatter.string(1, memory), "1 KB");
  EXPECT_EQ(formatter.string(-1, file), "-1 KB");
  EXPECT_EQ(formatter.string(1001, file), "2 KB");
  EXPECT_EQ(formatter.string(2048, memory), "2 KB");
  EXPECT_EQ(formatter.string(2049, binary), "5 KB");
  EXPECT_EQ(formatter.string(500'001, file), "1 MB");
  EXPECT_EQ(formatter.string(999'999, memory), "1 MB");
  EXPECT_EQ(formatter.string(-1'234'567, decimal), "-2 MB");
  using Limits = std::numeric_limits<std::int64_t>;
  EXPECT_EQ(formatter.string(Limits::max(), file), "9,22 EB");
  EXPECT_EQ(formatter.string(Limits::min(), file), "-9,22 EB");
  EXPECT_EQ(formatter.string(Limits::min(), memory), "-8 EB");
}

TEST(FuzzyByteCountFormatter, HidesEverySizeAmongMany) {
  const FuzzyByteCountFormatter formatter("en_US");
  for (const auto style : {file, memory}) {
    std::set<std::string> texts;
    for (std::int64_t count = 1; count < 50'000'000; count += 997)
      texts.insert(formatter.string(count, style));
    EXPECT_EQ(texts.size(), 15u);
  }
}

}  // namespace
}  // namespace Basalt
