// SPDX-License-Identifier: MIT
#include <Varnel/Basalt/JSON.h>

#include <gtest/gtest.h>

#include <limits>
#include <thread>

namespace Basalt {
namespace {

using namespace std::string_literals;
using Varnel::Platform::Date;
using Varnel::Platform::PropertyData;
using Varnel::Platform::PropertyDictionary;
using Varnel::Platform::PropertyList;

constexpr auto largest = std::numeric_limits<std::int64_t>::max();

TEST(JSON, IsReadFromTexts) {
  const std::pair<std::string_view, JSON> rows[] = {
      {" null\n", nullptr},
      {"true", true},
      {"-9223372036854775808", std::numeric_limits<std::int64_t>::min()},
      {"9223372036854775807", largest},
      {"9223372036854775808", 9223372036854775808.0},
      {"123456789012345678901234567890", 123456789012345678901234567890.0},
      {"1.0", 1.0},
      {"-0.5e-3", -0.0005},
      {R"("\u00e9\ud83d\ude00\u0000")", "é😀\0"s},
      {R"([[], {}, ""])", PropertyList{PropertyList(), PropertyDictionary(), ""}},
      {R"({"b": [1], "a": {"": null}, "b": 2})",
       PropertyDictionary{{"a", PropertyDictionary{{"", nullptr}}}, {"b", 2}}},
  };
  for (const auto& [text, value] : rows) {
    EXPECT_EQ(parseJSON(text), value) << text;
    EXPECT_EQ(parseJSON(jsonText(value)), value) << text;
  }
}

TEST(JSON, IsNotMadeUpFromWhatIsNone) {
  for (const std::string& text :
       {""s, " "s, "nul"s, "[1,]"s, "{1: 2}"s, "'a'"s, "01"s, "NaN"s, "1 2"s, "[] x"s, "1\0 2"s,
        "\0"s, "\"\0\""s, "\"\xff\""s, "\"\xed\xa0\x80\""s, R"("\ud800")"s, "\"\n\""s, "1e999"s})
    try {
      static_cast<void>(parseJSON(text));
      ADD_FAILURE() << testing::PrintToString(text);
    } catch (const JSONError& error) {
      EXPECT_EQ(error.kind(), JSONError::Kind::message);
      EXPECT_TRUE(std::string(error.what()).starts_with("Unable to read JSON")) << error.what();
    }
}

// A thread has a smaller stack than the process, and the limit must fit all of them.
TEST(JSON, IsNestedNoDeeperThanAnyStackHolds) {
  std::thread([] {
    const auto nested = [](std::size_t depth) {
      return std::string(depth, '[') + std::string(depth, ']');
    };
    EXPECT_EQ(jsonText(parseJSON(nested(512))), nested(512));
    for (const std::string& text : {nested(513), nested(100'000), std::string(100'000, '[')})
      EXPECT_THROW(static_cast<void>(parseJSON(text)), JSONError) << text.size();
  }).join();
}

TEST(JSON, BecomesOneLineWithoutWhatItCannotCarry) {
  const JSON value =
      PropertyDictionary{{"bytes", PropertyData{std::byte{1}}},
                         {"date", Date()},
                         {"list", PropertyList{nullptr, false, largest, 1.5, "two\nlines"}},
                         {"number", std::numeric_limits<double>::infinity()},
                         {"text\xff", "é\xc3"}};
  EXPECT_EQ(jsonText(value),
            R"({"bytes":null,"date":null,"list":[null,false,9223372036854775807,1.5,"two\nlines"],)"
            R"("number":null,"text�":"é�"})");
}

}  // namespace
}  // namespace Basalt
