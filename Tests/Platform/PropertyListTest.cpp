// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Text/PropertyListParser.h>
#include <Varnel/Platform/Text/PropertyListWriter.h>
#include <Varnel/Platform/Text/StringsTable.h>

#include <gtest/gtest.h>

#include <bit>
#include <clocale>
#include <cmath>
#include <cstdlib>
#include <limits>
#include <string>
#include <thread>
#include <vector>

#include <Tests/Support/TemporaryFolder.h>

namespace Varnel::Platform {
namespace {

using namespace std::chrono;
using namespace std::string_literals;

std::string repeated(std::string_view text, int times) {
  std::string result;
  for (; times > 0; --times) result += text;
  return result;
}

std::string nested(std::string_view opening, std::string_view closing, int depth) {
  return "<plist>" + repeated(opening, depth) + "<true/>" + repeated(closing, depth) + "</plist>";
}

std::string bigEndian(std::uint64_t number, int size) {
  std::string bytes;
  for (int index = size - 1; index >= 0; --index) bytes += static_cast<char>(number >> (8 * index));
  return bytes;
}

std::string binaryList(const std::vector<std::string>& objects, std::uint64_t root = 0) {
  std::string bytes = "bplist00";
  std::string table;
  for (const std::string& object : objects) {
    table += bigEndian(bytes.size(), 4);
    bytes += object;
  }
  const std::size_t tableOffset = bytes.size();
  return bytes + table + std::string(6, '\0') + "\4\2" + bigEndian(objects.size(), 8) +
         bigEndian(root, 8) + bigEndian(tableOffset, 8);
}

std::string binaryArray(const std::vector<int>& references) {
  std::string object = "\xAF\x12" + bigEndian(references.size(), 4);
  for (const int reference : references)
    object += bigEndian(static_cast<std::uint64_t>(reference), 2);
  return object;
}

std::optional<PropertyValue> parsedElement(const std::string& element) {
  return parsePropertyList("<plist version=\"1.0\">" + element + "</plist>");
}

TEST(PropertyList, ReadsAnInformationDictionary) {
  const auto list = parsePropertyList(R"(<?xml version="1.0" encoding="UTF-8"?>
<!DOCTYPE plist PUBLIC "-//Apple//DTD PLIST 1.0//EN" "http://www.apple.com/DTDs/PropertyList-1.0.dtd">
<plist version="1.0">
<dict>
  <!-- It's what the host gives, <dict> in a comment included -->
  <key>CFBundleName</key><string>Orvane &amp; S&#246;hne</string>
  <key>Count</key><integer>-42</integer>
  <key>Ratio</key><real>1.5</real>
  <key>Beta</key><false/>
  <key>Icon</key><data>AAH/</data>
  <key>Built</key><date>2024-02-29T12:00:00Z</date>
  <key>Old</key><date>1995-01-01T00:00:00Z</date>
  <key>Languages</key><array><string>en</string><string/><array/></array>
  <key>Nested</key><dict><key>a</key><string><![CDATA[<b>]]></string></dict>
  <key>Twice</key><string>first</string><key>Twice</key><string>last</string>
</dict>
</plist>
)");
  const PropertyDictionary expected{
      {"CFBundleName", "Orvane & Söhne"},
      {"Count", std::int64_t{-42}},
      {"Ratio", 1.5},
      {"Beta", false},
      {"Icon", PropertyData{std::byte{0}, std::byte{1}, std::byte{255}}},
      {"Built", Date(sys_days(2024y / February / 29) + 12h)},
      {"Old", Date(sys_days(1995y / January / 1))},
      {"Languages", PropertyList{"en", "", PropertyList{}}},
      {"Nested", PropertyDictionary{{"a", "<b>"}}},
      {"Twice", "last"},
  };
  EXPECT_EQ(list, PropertyValue(expected));
}

TEST(PropertyList, ReadsTheBinaryForm) {
  std::string dictionary = "\xD4";
  for (std::uint64_t reference = 1; reference <= 8; ++reference)
    dictionary += bigEndian(reference, 2);
  const std::string number = "\x13" + bigEndian(static_cast<std::uint64_t>(-7), 8);
  const std::string bytes =
      binaryList({dictionary, "Qa", "Qb", "Qc", "Qd", number, "\x63\x00g\xD8\x3D\xDE\x00"s,
                  "\x80\x05", binaryArray({6, 6})});
  const PropertyDictionary expected{{"a", std::int64_t{-7}},
                                    {"b", "g😀"},
                                    {"c", std::int64_t{5}},
                                    {"d", PropertyList{"g😀", "g😀"}}};
  EXPECT_EQ(parsePropertyList(bytes), PropertyValue(expected));
  for (std::size_t size = 0; size < bytes.size(); ++size)
    EXPECT_EQ(parsePropertyList(std::string_view(bytes).substr(0, size)), std::nullopt) << size;
  // Any byte may be wrong, those of the table of offsets and of the trailer too.
  for (std::size_t index = 0; index < bytes.size(); ++index)
    for (const char wrong : {'\x00', '\x01', '\x7F', '\x80', '\xFF'}) {
      std::string damaged = bytes;
      damaged[index] = wrong;
      EXPECT_NO_THROW((void)parsePropertyList(damaged)) << index;
    }
}

TEST(PropertyList, TakesExtremeScalarsAsFarAsTheyHaveACounterpart) {
  const std::pair<const char*, PropertyValue> elements[] = {
      {"<integer>-9223372036854775808</integer>", std::numeric_limits<std::int64_t>::min()},
      {"<integer>18446744073709551615</integer>", std::int64_t{-1}},
      {"<integer>\n\t+0x1F </integer>", std::int64_t{31}},
      {"<real> -2.5e-3 </real>", -0.0025},
      {"<real>+infinity</real>", std::numeric_limits<double>::infinity()},
      {"<date>4001-01-01T00:00:00Z</date>", Date(sys_days(4001y / January / 1))},
      {"<date>1601-02-28T23:59:59Z</date>", Date(sys_days(1601y / March / 1) - 1s)},
  };
  for (const auto& [element, value] : elements) EXPECT_EQ(parsedElement(element), value) << element;
  const auto binaryDate = [](double secondsFrom2001) {
    return parsePropertyList(
        binaryList({"\x33" + bigEndian(std::bit_cast<std::uint64_t>(secondsFrom2001), 8)}));
  };
  for (const double distance : {-100'000'000.75, -1.5, -0.5, 0.25, 700'000'000.125})
    EXPECT_EQ(binaryDate(distance), PropertyValue(Date(sys_days(2001y / January / 1) +
                                                       microseconds(llround(distance * 1e6)))));
  EXPECT_EQ(binaryDate(1e300), std::nullopt);
  EXPECT_EQ(binaryDate(std::numeric_limits<double>::quiet_NaN()), std::nullopt);
  EXPECT_EQ(parsePropertyList("\xEF\xBB\xBF<plist><true/></plist>"), PropertyValue(true));
}

static_assert(!std::is_constructible_v<PropertyValue, const void*>);
static_assert(!std::is_constructible_v<PropertyValue, const int*>);
static_assert(!std::is_constructible_v<PropertyValue, std::uint64_t>, "it may not fit");

TEST(PropertyValue, TakesWhatHasOneMeaning) {
  EXPECT_EQ(PropertyValue(std::int8_t{-7}), PropertyValue(std::int64_t{-7}));
  EXPECT_EQ(PropertyValue(4294967295u), PropertyValue(std::int64_t{4294967295}));
  EXPECT_EQ(*PropertyValue(1.5f).as<double>(), 1.5);
  EXPECT_EQ(*PropertyValue(std::string_view("a\0b", 3)).as<std::string>(), "a\0b"s);
}

TEST(PropertyList, RefusesWhatIsNone) {
  for (const char* bytes :
       {"", " ", "bplist00", "garbage", "<", "<plist>", "<plist></plist>", "<plist/>", "<html/>",
        "<plist><dict><key>a</key></plist>", "<plist><dict><true/></dict></plist>",
        "<plist><array></dict></plist>", "<plist><array><!-- </array></plist>",
        "<plist><string>&#0;</string></plist>", "<plist><string>&unknown;</string></plist>",
        "<!DOCTYPE plist [<!ENTITY a 'b'>]><plist><string>&a;</string></plist>"})
    EXPECT_EQ(parsePropertyList(bytes), std::nullopt) << bytes;
  EXPECT_EQ(parsePropertyList(std::string(100, '\0')), std::nullopt);
  EXPECT_EQ(writePropertyList(PropertyList{true, nullptr}), std::nullopt);
  for (const std::string& text : {"\x53k\0y"s, "\x63\0k\0\0\0y"s}) {
    EXPECT_EQ(parsePropertyList(binaryList({text})), std::nullopt);
    EXPECT_EQ(parsePropertyList(binaryList({"\xD1\0\1\0\1"s, text})), std::nullopt);
  }
}

TEST(PropertyList, RefusesNumbersAndDatesThatAreNone) {
  const std::pair<const char*, std::vector<const char*>> rows[] = {
      {"integer",
       {"", " ", "abc", "42abc", "4 2", "1.5", "--5", "- 5", "-+5", "010", "0x", "0xG",
        "4<!-- -->2", "<![CDATA[42]]>", "&#52;2", "-9223372036854775809", "18446744073709551616",
        "0x10000000000000000", "99999999999999999999999"}},
      {"real", {"", "abc", "1.5x", "1,5", "+-1", "1e999", "0x1p3", "1 000"}},
      {"date",
       {"", "hello", "2024-02-29", "2024-02-30T00:00:00Z", "2023-02-29T00:00:00Z",
        "2024-13-01T00:00:00Z", "2024-02-29T24:00:00Z", "2024-02-29T12:60:00Z",
        "2024-02-29T12:00:60Z", "2024-02-29T12:00:00", "2024-02-29T12:00:00Zx",
        "2024-02-29T12:00:00+01:00", "2024-02-29 12:00:00Z", " 2024-02-29T12:00:00Z"}},
  };
  for (const auto& [element, texts] : rows) {
    EXPECT_EQ(parsedElement("<" + std::string(element) + "/>"), std::nullopt) << element;
    for (const char* text : texts)
      EXPECT_EQ(parsedElement("<" + std::string(element) + ">" + text + "</" + element + ">"),
                std::nullopt)
          << element << " " << text;
  }
  EXPECT_EQ(parsePropertyList(binaryList({"\x14" + bigEndian(1, 8) + bigEndian(5, 8)})),
            std::nullopt);
  EXPECT_EQ(parsePropertyList(binaryList({"\x14" + bigEndian(0, 8) + bigEndian(5, 8)})),
            PropertyValue(std::int64_t{5}));
  EXPECT_EQ(parsePropertyList(binaryList({"\x88\1" + bigEndian(5, 8)})), std::nullopt);
}

// A locale of the test's own, since a machine may have none whose numbers have a comma.
TEST(PropertyList, IsTheSameInEveryLocaleOfTheHost) {
  const Tests::TemporaryFolder folder;
  const std::string source = folder.write(
      "source",
      "LC_NUMERIC\ndecimal_point \",\"\nthousands_sep \".\"\ngrouping 3\nEND LC_NUMERIC\n");
  const std::string made = (folder.path() / "xx_XX").string();
  // It fails over the categories that are left out, and makes the locale all the same.
  static_cast<void>(
      std::system(("localedef -c -i " + source + " " + made + " 2>/dev/null").c_str()));
  ::setenv("LOCPATH", folder.path().c_str(), 1);
  if (!std::setlocale(LC_NUMERIC, "xx_XX"))
    GTEST_SKIP() << "The machine has no character maps to make a locale from.";
  const PropertyValue value(PropertyList{1.5, -0.1, Date(sys_days(2024y / May / 1))});
  const auto written = writePropertyList(value);
  const auto read = parsedElement("<real>1.5</real>");
  const std::string hosts = std::to_string(1.5);
  std::setlocale(LC_NUMERIC, "C");
  EXPECT_EQ(read, PropertyValue(1.5));
  EXPECT_EQ(parsePropertyList(written.value_or("")), value);
  EXPECT_EQ(hosts, "1,500000") << "and the host keeps its own";
}

TEST(PropertyList, WritesWholeSecondsOfDates) {
  for (const auto fraction : {0us, 1us, 999'999us})
    for (const Date second : {sys_days(1999y / May / 1) + 0s, sys_days(2001y / January / 1) - 1s})
      EXPECT_EQ(parsePropertyList(writePropertyList(second + fraction).value_or("")),
                PropertyValue(second));
}

// A thread has a smaller stack than the process, and the limit must fit all of them.
TEST(PropertyList, RefusesAbsurdNesting) {
  std::thread([] {
    EXPECT_TRUE(parsePropertyList(nested("<array>", "</array>", 512)).has_value());
    EXPECT_TRUE(parsePropertyList(nested("<dict><key>a</key>", "</dict>", 512)).has_value());
    EXPECT_EQ(parsePropertyList(nested("<array>", "</array>", 513)), std::nullopt);
    EXPECT_TRUE(parsedElement("<array>" + repeated("<array/><dict/>", 513) + "</array>"))
        << "one beside the other";
    for (const char* opening : {
             "<array>",
             "<dict><key>a</key>",
             "<array a=\"/>\">",
             "<array a=\"</array>\">",
             "<array\v>",
             "<array><!-- </array> -->",
             "<array><!--></array>-->",
             "<array><?x \" ?></array><?y \" ?>",
             "<array><?x > </array> ?>",
             "<array><!DOCTYPE \"></array>\">",
             "<array><string><![CDATA[</array>]]></string>",
         })
      for (const char* closing : {"", "</array>", "</dict>"})
        EXPECT_EQ(parsePropertyList(nested(opening, closing, 100'000)), std::nullopt) << opening;

    std::vector<std::string> chain;
    for (int index = 0; index < 60'000; ++index) chain.push_back(binaryArray({index + 1}));
    chain.emplace_back("\x09");
    EXPECT_EQ(parsePropertyList(binaryList(chain)), std::nullopt);
    EXPECT_TRUE(parsePropertyList(binaryList(chain, 60'000 - 500)).has_value());
  }).join();
}

TEST(PropertyList, RefusesBinaryListsThatAreCyclicOrMultiply) {
  EXPECT_EQ(parsePropertyList(binaryList({binaryArray({0})})), std::nullopt);
  EXPECT_EQ(parsePropertyList(binaryList({binaryArray({1}), binaryArray({2}), binaryArray({0})})),
            std::nullopt);
  EXPECT_EQ(parsePropertyList(binaryList({binaryArray({7})})), std::nullopt);
  EXPECT_EQ(parsePropertyList(binaryList({"\x09"}, 1)), std::nullopt);

  std::vector<std::string> doubling;
  for (int index = 0; index < 60; ++index) doubling.push_back(binaryArray({index + 1, index + 1}));
  doubling.emplace_back("\x09");
  EXPECT_EQ(parsePropertyList(binaryList(doubling)), std::nullopt);

  const std::string longString = "\x5F\x12" + bigEndian(1 << 20, 4) + std::string(1 << 20, 'x');
  EXPECT_EQ(parsePropertyList(binaryList({binaryArray(std::vector<int>(20'000, 1)), longString})),
            std::nullopt);

  for (const char marker : {'\x4F', '\x5F', '\x6F', '\xAF', '\xCF', '\xDF'})
    for (const std::uint64_t count : {~0ull, ~0ull >> 1, 1ull << 32, 1ull << 20})
      EXPECT_EQ(parsePropertyList(binaryList({marker + "\x13"s + bigEndian(count, 8)})),
                std::nullopt);
}

TEST(PropertyList, RefusesWhatTakesQuadraticTime) {
  EXPECT_EQ(parsedElement("<string>" + repeated("&amp;", 1'000'000) + "</string>"), std::nullopt);
  EXPECT_EQ(parsedElement("<string>" + repeated("&amp;<!---->", 1'000'000) + "</string>"),
            std::nullopt);
  EXPECT_TRUE(parsedElement("<string>" + repeated("&amp;", 10'000) + "</string>").has_value());

  const auto dictionary = [](int keyCount) {
    std::string keys = "<dict>";
    for (int key = 0; key < keyCount; ++key)
      keys += "<key>" + std::to_string(key) + "</key><true/>";
    return keys + "</dict>";
  };
  EXPECT_TRUE(parsedElement(dictionary(16'000)).has_value());
  EXPECT_EQ(parsedElement(dictionary(200'000)), std::nullopt);
  EXPECT_EQ(parsedElement("<string>" + std::string(17 << 20, 'x') + "</string>"), std::nullopt);
}

TEST(StringsTable, KeepsTextsAlone) {
  const auto table = parseStringsTable(
      "<plist><dict><key>Varnel_Quit</key><string>Beenden %@</string><key>a</key><integer>1"
      "</integer><key></key><string>empty key</string></dict></plist>");
  const StringsTable expected{{"", "empty key"}, {"Varnel_Quit", "Beenden %@"}};
  EXPECT_EQ(table, expected);
  EXPECT_EQ(parseStringsTable("<plist><array/></plist>"), std::nullopt);
  EXPECT_EQ(parseStringsTable("\"key\" = \"value\";"), std::nullopt);
  EXPECT_EQ(parseStringsTable("<plist><dict/></plist>"), StringsTable());
}

}  // namespace
}  // namespace Varnel::Platform
