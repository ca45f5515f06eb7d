// SPDX-License-Identifier: MIT
#include <orvane/ResultText.h>

#include <sys/stat.h>

#include <nlohmann/json.hpp>

#include <Tests/Programs/ScanFixture.h>
#include <Varnel/Paths/QNURLResolver.h>
#include <Varnel/Platform/Text/ByteCountFormatter.h>
#include <Varnel/Platform/Values/URL.h>
#include <orvane/ScanReport.h>

namespace Orvane::Testing {
namespace {

using ::testing::EndsWith;
using ::testing::HasSubstr;
using ::testing::StartsWith;
using Varnel::Platform::URL;

class ResultText : public ScanFixture {
 protected:
  /// The text, with the scanned folder as "~".
  std::string textOf(const ScanResult& result, const TextForm& form) const {
    std::string text;
    const auto write = [&](std::string_view part) {
      text += part;
      return true;
    };
    const URL home = URL::fileURLWithPath(folder.path() + "/");
    EXPECT_TRUE(writeText(result, form, Varnel::Platform::ByteCountFormatter("en_US"),
                          Varnel::QNURLResolver(home, URL::fileURLWithPath("/")), write));
    return text;
  }
  std::string textOf(const TextForm& form) { return textOf(scan(), form); }
};

TEST_F(ResultText, EndsWithTheSummaryAndWhatMattersMostNearTheUser) {
  for (const char* name : {"a/x", "b/x"}) folder.write(name, "small");
  for (const char* name : {"1", "2", "3"}) folder.write(name, bytes(2000, 'l'));
  fs::create_hard_link(folder.path("2"), folder.path("a-link"));
  const std::string large =
      "3 files of 2 KB, 4 KB wasted\n  ~/1\n  ~/2\n    also ~/a-link\n  ~/3\n\n";
  const std::string folders = "2 folders of 1 file and 5 bytes, 5 bytes wasted\n  ~/a/\n  ~/b/\n\n";
  const std::string summary =
      "6 files in 3 folders: 3 duplicates in 2 groups, 4 KB wasted; 1 group of folders that hold "
      "the "
      "same\n";
  EXPECT_EQ(textOf({}), large + folders + summary);
  EXPECT_EQ(textOf({.endsWithMost = true}), folders + large + summary);
  EXPECT_EQ(textOf({.maxGroups = 1}), large + summary);
  EXPECT_EQ(textOf({.maxGroups = 1, .endsWithMost = true}), large + summary);
  EXPECT_EQ(textOf({.maxGroups = 0}), summary);
  EXPECT_EQ(textOf({.shouldStop = [] { return true; }}), summary);
  EXPECT_EQ(
      textOf({.maxGroups = 0, .columns = 40, .isBold = true}),
      "\x1b[1m6 files in 3 folders: 3 duplicates in 2\ngroups, 4 KB wasted; 1 group of folders\n"
      "that hold the same\x1b[0m\n");
}

TEST_F(ResultText, SaysWhereNothingIsWastedAndWhereFilesAreMissing) {
  const ScanFolder elsewhere;
  for (const char* name : {"x", "y"})
    fs::create_hard_link(folder.write(name, "same"), elsewhere.path(name));
  EXPECT_THAT(textOf({}), AllOf(StartsWith("2 files of 4 bytes, nothing wasted\n"),
                                EndsWith(": 1 duplicate in 1 group, nothing wasted\n")));
  fileSystem.beforeOpen = [&](const std::string&) { control.isCancelled = true; };
  // Readers that were at work already may still find a group.
  EXPECT_THAT(textOf({.maxGroups = 0}), StartsWith("interrupted; so far 2 files in 1 folder: "));
}

TEST_F(ResultText, ReportsTheStateOfEachFile) {
  const std::string plain = folder.write("a/b/plain", "same");
  const std::string odd = folder.write("a/c/odd\xff", "same");
  fs::create_hard_link(odd, folder.path("a/c/z\xfe"));
  const timespec before1970[] = {{0, UTIME_OMIT}, {-2, 5}};
  ASSERT_EQ(::utimensat(-1, plain.c_str(), before1970, 0), 0);
  struct stat facts;
  ASSERT_EQ(::stat(odd.c_str(), &facts), 0);
  const auto report = [&](std::size_t maxGroups) {
    std::string text;
    const auto write = [&](std::string_view part) {
      text += part;
      return true;
    };
    const ScanFacts about{.startedAt = std::chrono::sys_days(std::chrono::year(2026) / 1 / 2),
                          .folders = {folder.path(), "/\xe9"}};
    EXPECT_TRUE(writeReport(scan(), about, maxGroups, write));
    EXPECT_THAT(text, EndsWith("}\n"));
    return nlohmann::json::parse(text);
  };
  const auto whole = report(TextForm::allGroups);
  EXPECT_EQ(whole["startedAt"], "2026-01-02T00:00:00Z");
  EXPECT_EQ(whole["roots"], nlohmann::json({folder.path(), "/\xEF\xBF\xBD"}));
  EXPECT_EQ(whole["rootURLs"][1], "file:///%E9");
  ASSERT_EQ(whole["groups"].size(), 1u);
  const auto& files = whole["groups"][0]["files"];
  EXPECT_EQ(files[0]["path"], plain);
  EXPECT_EQ(files[0]["modified"], "-2.000000005");
  EXPECT_EQ(files[0].size(), 3u);
  EXPECT_EQ(files[1]["path"], folder.path("a/c/odd\xEF\xBF\xBD"));
  EXPECT_EQ(files[1]["url"], URL::fileURLWithPath(odd).absoluteString());
  EXPECT_EQ(files[1]["inode"], facts.st_ino);
  EXPECT_THAT(files[1]["modified"], StartsWith(std::to_string(facts.st_mtim.tv_sec) + "."));
  EXPECT_EQ(files[1]["names"], nlohmann::json({folder.path("a/c/z\xEF\xBF\xBD")}));
  EXPECT_EQ(files[1]["nameURLs"],
            nlohmann::json({URL::fileURLWithPath(folder.path("a/c/z\xfe")).absoluteString()}));
  const auto bare = report(0);
  EXPECT_EQ(bare["groups"], nlohmann::json::array());
  EXPECT_EQ(bare["duplicateGroups"], 1);
}

}  // namespace
}  // namespace Orvane::Testing
