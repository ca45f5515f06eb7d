// SPDX-License-Identifier: MIT
#include <Basalt/FuzzyByteCountFormatter.h>

#include <cstdint>
#include <limits>

#include <gtest/gtest.h>

namespace Basalt {
namespace {

using Varnel::Platform::ByteCountStyle;

TEST(FuzzyByteCountFormatter, TellsTheOrderOfASizeAlone) {
  const FuzzyByteCountFormatter formatter("en_US");
  struct Row {
    std::int64_t count;
    ByteCountStyle style;
    const char* text;
  };
  const Row rows[] = {
      {0, ByteCountStyle::file, "Zero KB"},
      {1, ByteCountStyle::file, "1 KB"},
      {-999, ByteCountStyle::file, "-1 KB"},
      {9'999, ByteCountStyle::file, "9 KB"},
      {987'654'321, ByteCountStyle::decimal, "900 MB"},
      {1023 * 1024, ByteCountStyle::memory, "1000 KB"},
      {1024 * 1024, ByteCountStyle::binary, "1 MB"},
      {std::numeric_limits<std::int64_t>::max(), ByteCountStyle::file, "9 EB"},
      {std::numeric_limits<std::int64_t>::min(), ByteCountStyle::memory, "-8 EB"},
  };
  for (const Row& row : rows)
    EXPECT_EQ(formatter.string(row.count, row.style), row.text) << row.count;
}

}  // namespace
}  // namespace Basalt
