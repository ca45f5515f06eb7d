// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>

#include <sstream>
#include <string>

#include <Removal/Report.h>
#include <Removal/Selection.h>

namespace Orvane {
namespace {

using ::testing::HasSubstr;

auto read(const std::string& text) {
  std::istringstream stream(text);
  return readReport(stream);
}

TEST(Report, IsReadWithAllThatARemovalNeeds) {
  const auto report = read(R"({"later": [{"groups": [1]}], "schemaVersion": 1, "partial": true,
    "roots": ["/\uFFFD", "/a"], "rootURLs": ["file:///%E9", "file:///a"], "files": 7, "groups": [
      {"size": 12, "wastedBytes": 12, "files": [
        {"path": "/a/\uFFFD", "url": "file:///a/%FF%20", "inode": 18446744073709551615,
         "modified": "-5.000000001", "names": ["/a/\uFFFD"], "nameURLs": ["file:///a/%FE"],
         "later": {"path": "/x"}},
        {"path": "/a/b", "inode": 2, "modified": "1732249591.123456789", "reference": true}]},
      {"files": []}]})");
  ASSERT_TRUE(report) << report.error();
  EXPECT_EQ(*report, (Report{.isPartial = true,
                             .roots = {"/\xe9", "/a"},
                             .groups = {{.size = 12,
                                         .files = {{.path = "/a/\xff ",
                                                    .inode = 18446744073709551615u,
                                                    .modified = -5,
                                                    .nanoseconds = 1,
                                                    .names = {"/a/\xfe"}},
                                                   {.path = "/a/b",
                                                    .inode = 2,
                                                    .modified = 1732249591,
                                                    .nanoseconds = 123456789,
                                                    .isReference = true}}},
                                        {}}}));
}

std::string withFile(const std::string& members) {
  return R"({"schemaVersion": 1, "groups": [{"size": 1, "files": [{)" + members + "}]}]}";
}

TEST(Report, IsRefusedWithTheReason) {
  const struct {
    std::string text;
    std::string reason;
  } rows[] = {
      {"", "ends too early"},
      {"7", "no object"},
      {"[{}]", "no object"},
      {"\xff ", "not JSON"},
      {"{}", "no schemaVersion"},
      {R"({"schemaVersion": 2})", "later version"},
      {R"({"schemaVersion": -1})", "odd number"},
      {R"({"schemaVersion": 1, "groups": [)", "ends too early"},
      {R"({"schemaVersion": 1} {})", "not JSON"},
      {R"({"schemaVersion": 1, "groups": [{"size": 1.5}]})", "odd number"},
      {withFile(R"("path": "a", "modified": "1.000000000")"), "no plain, absolute path"},
      {withFile(R"("path": "/a\u0000b", "modified": "1.000000000")"), "no plain, absolute path"},
      {withFile(R"("path": "/a/../b", "modified": "1.000000000")"), "no plain, absolute path"},
      {withFile(R"("path": "/a/.", "modified": "1.000000000")"), "no plain, absolute path"},
      {withFile(R"("path": "/a//b", "modified": "1.000000000")"), "no plain, absolute path"},
      {withFile(R"("path": "/a/", "modified": "1.000000000")"), "no plain, absolute path"},
      {withFile(R"("reference": "true")"), "neither true nor false"},
      {withFile(R"("reference": [true])"), "neither true nor false"},
      {withFile(R"("path": "/a", "names": ["b"], "modified": "1.000000000")"), "absolute"},
      {withFile(R"("path": "/a", "url": "https://quennel.example/a")"), "URL"},
      {withFile(R"("path": "/a")"), "no time"},
      {withFile(R"("path": "/a", "modified": "1.5")"), "no time"},
      {withFile(R"("path": "/a", "modified": "1.-00000005")"), "no time"},
      {withFile(R"("path": "/)" + std::string(2 << 20, 'a') + "\""), "too long"},
      {R"({"a": )" + std::string(100, '['), "too deep"},
  };
  for (const auto& row : rows) {
    const auto report = read(row.text);
    ASSERT_FALSE(report) << row.text.substr(0, 80);
    EXPECT_THAT(report.error(), HasSubstr(row.reason)) << row.text.substr(0, 80);
  }
}

Report oneGroup(std::vector<ReportFile> files) {
  return {.roots = {"/b", "/"}, .groups = {{.size = 1, .files = std::move(files)}}};
}

TEST(Selection, KeepsOneFileByTheRuleAndSaysWhereItIsATie) {
  const ReportFile early{.path = "/a/early", .modified = -3, .nanoseconds = 5};
  const ReportFile later{.path = "/a/later.txt", .modified = -3, .nanoseconds = 6};
  const ReportFile latest{.path = "/b/last", .modified = 9};
  const ReportFile same{.path = "/b/more", .modified = 9};
  const ReportFile stays{.path = "/bb/reference", .modified = 1, .isReference = true};
  const ReportFile staysToo{.path = "/r", .modified = 2, .isReference = true};
  using Victims = std::vector<std::size_t>;
  const struct {
    KeepRule rule;
    std::vector<ReportFile> files;
    std::size_t kept;
    bool isTie;
    Victims victims;
  } rows[] = {
      {KeepRule::oldest, {later, early, latest}, 1, false, {0, 2}},
      {KeepRule::newest, {early, latest, later, same}, 1, true, {0, 2, 3}},
      {KeepRule::newest, {latest, same, {.path = "/c", .modified = 10}}, 2, false, {0, 1}},
      {KeepRule::shortest, {later, latest, same}, 1, true, {0, 2}},
      {KeepRule::firstFolder, {early, stays, latest}, 1, false, {0, 2}},
      {KeepRule::firstFolder, {early, later, latest}, 2, false, {0, 1}},
      {KeepRule::oldest, {early, stays, staysToo}, 1, false, {0}},
      {KeepRule::oldest, {latest, same}, 0, true, {1}},
  };
  for (const auto& row : rows) {
    const Selection selection = select(oneGroup(row.files), row.rule);
    const Choice expected{.kept = row.kept, .victims = row.victims, .isTie = row.isTie};
    EXPECT_EQ(selection, Selection{expected}) << &row - rows;
    EXPECT_FALSE(check(oneGroup(row.files), selection)) << &row - rows;
  }
  EXPECT_EQ(select(oneGroup({early}), KeepRule::oldest), Selection{});
  const auto isEarly = [](const std::string& path) { return path.ends_with("/early"); };
  const Selection lasting{{.kept = 1, .victims = {0, 2}}};
  EXPECT_EQ(select(oneGroup({early, later, latest}), KeepRule::oldest, isEarly), lasting);
  EXPECT_EQ(select(oneGroup({stays, staysToo}), KeepRule::oldest), Selection{});
}

TEST(Selection, NeverTakesTheLastFileOrAReference) {
  Report report = oneGroup({{.path = "/a"},
                            {.path = "/b", .names = {"/a"}},
                            {.path = "/c", .names = {"/f"}, .isReference = true},
                            {.path = "/d", .names = {"/e"}}});
  // Whoever writes this names some files again.
  report.groups.push_back(
      {.files = {{.path = "/g"}, {.path = "/e"}, {.path = "/h", .names = {"/f"}}}});
  using enum Refusal::Reason;
  const struct {
    Selection selection;
    std::optional<Refusal::Reason> reason;
  } rows[] = {
      {{}, std::nullopt},
      {{{.kept = 0, .victims = {3}}}, std::nullopt},
      {{{.kept = 0, .victims = {1}}}, kept},
      {{{.kept = 0, .victims = {3, 0}}}, kept},
      {{{.kept = 0, .victims = {3, 2}}}, reference},
      {{{.kept = 0, .victims = {3, 3}}}, unknown},
      {{{.kept = 4, .victims = {3}}}, unknown},
      {{{.kept = 0, .victims = {4}}}, unknown},
      {{{.group = 2}}, unknown},
      {{{.kept = 3, .victims = {0}}, {.group = 1, .kept = 0, .victims = {1}}}, kept},
      {{{.group = 1, .kept = 0, .victims = {2}}}, reference},
      {{{.kept = 0, .victims = {3}}, {.kept = 3, .victims = {0}}}, unknown},
  };
  for (const auto& row : rows) {
    const auto refusal = check(report, row.selection);
    EXPECT_EQ(refusal ? std::optional(refusal->reason) : std::nullopt, row.reason) << &row - rows;
  }
}

}  // namespace
}  // namespace Orvane
