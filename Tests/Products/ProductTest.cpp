// SPDX-License-Identifier: MIT
#include <string>
#include <vector>

#include <gmock/gmock.h>

#include <Tests/Support/ChildProcess.h>

namespace Varnel::Tests {
namespace {

using Lines = std::vector<std::string>;

Lines linesOf(const std::string& program) {
  ChildProcess process({PRODUCTS_FOLDER "/" + program});
  Lines lines;
  for (std::string line; !(line = process.readLine()).empty();) lines.push_back(line);
  return lines;
}

const Lines fotovia = {"Welcome to Fotovia \"3\"",
                       "3.1 (3.1.7)",
                       "com.quennel.Fotovia3",
                       "http://links.fotovia.example/index.php",
                       "beta",
                       "com.quennel.Orvane-marketta",
                       "never"};

// One library serves them all, however the program was linked.
TEST(Products, EachProgramIsItsOwnProduct) {
  EXPECT_EQ(linesOf("Fotovia"), fotovia);
  EXPECT_EQ(linesOf("FotoviaThatExportsNothing"), fotovia);
  EXPECT_EQ(linesOf("FotoviaOfAnArchive"), fotovia);
  EXPECT_EQ(linesOf("FotoviaWithTheLibraryInside"), fotovia);
  EXPECT_EQ(linesOf("Sweeper"), (Lines{"Welcome to S;w\\${e}e@p@)varnel\"é", "0 (0)", "Sweeper",
                                       "http://sweeper.example/index.php", "released",
                                       "com.quennel.Orvane2", "onceInTwoWeeks"}));
}

TEST(Products, AProgramThatDeclaresNoneGoesByItsExecutablesNameOnTheSite) {
  EXPECT_EQ(linesOf("Undeclared"),
            (Lines{"Welcome to Undeclared", " ()", "Undeclared", "no link", "released",
                   "com.quennel.site.Orvane2", "onceInTwoWeeks"}));
}

TEST(Products, AProductThatSetsNoChannelStopsWhereItIsAskedForOne) {
  const Lines lines = linesOf("WithoutChannel");
  ASSERT_EQ(lines.size(), 5U);
  EXPECT_EQ(lines.front(), "Welcome to Nowhere");
}

TEST(Products, AHostPutsItsOwnServiceInThePlaceOfOne) {
  const Lines lines = linesOf("HostWithItsOwnClock");
  using testing::HasSubstr;
  EXPECT_THAT(lines, testing::ElementsAre(HasSubstr("/1970-01-1"), HasSubstr("[1970-01-1"),
                                          "one replaced"));
}

TEST(Products, AHostsTestRunsOnFakesAndTheFrameworksTexts) {
  EXPECT_EQ(linesOf("HostTestWithFakes"), Lines{"done"});
}

}  // namespace
}  // namespace Varnel::Tests
