// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>

#include <filesystem>
#include <fstream>

#include <Removal/Removal.h>
#include <Tests/Programs/OrvaneFixture.h>
#include <Tests/Support/DiskImage.h>
#include <Tests/Support/MountNamespace.h>
#include <orvane/StepText.h>
#include <orvane/TextColumns.h>

namespace Orvane::Testing {
namespace {

namespace fs = std::filesystem;
using ::testing::AllOf;
using ::testing::HasSubstr;

TEST_F(Orvane, MovesDuplicatesToTheTrashAndRestoresThem) {
  const std::string kept = folder.write("a", "same");
  const std::string odd = folder.write("b\xff/line\nbreak", "same");
  const std::string copy = folder.write("b/copy", "same");
  const std::vector<std::string> trash = {"trash", "-k", "shortest", folder.path()};
  const Outcome shown = run(trash);
  EXPECT_EQ(shown.status, 0);
  EXPECT_THAT(shown.output, AllOf(HasSubstr("stays " + kept), HasSubstr("b\\xFF/line\\nbreak\n"),
                                  HasSubstr("2 files would go to the trash: 8 bytes")));
  EXPECT_TRUE(fs::exists(odd) && fs::exists(copy));

  std::vector<std::string> yes = trash;
  yes.push_back("--yes");
  const Outcome moved = run(yes);
  EXPECT_EQ(moved.status, 0) << moved.errors;
  EXPECT_THAT(moved.output, HasSubstr("2 files were moved to the trash: 8 bytes"));
  EXPECT_FALSE(fs::exists(odd) || fs::exists(copy));
  EXPECT_THAT(run({"restore", "--list"}).output,
              AllOf(::testing::StartsWith("1  "), HasSubstr("  2 files, 8 bytes\n")));

  folder.write("b/copy", "new");
  const Outcome half = run({"restore"});
  EXPECT_EQ(half.status, 3);
  EXPECT_THAT(half.output, AllOf(HasSubstr("something else has its place"), HasSubstr("1 not\n")));
  EXPECT_EQ(read(odd) + read(copy), "samenew");
  fs::remove(copy);
  const Outcome unheard = run({"restore", "1"}, ">/dev/full");
  EXPECT_EQ(unheard.status, 1);
  EXPECT_EQ(unheard.errors, "orvane: cannot write the result: No space left on device\n");
  EXPECT_EQ(read(copy), "same");
  expectFailure({"restore"}, "something to give back");
  expectFailure({"restore", "7"}, "no removal 7");
  expectFailure({"trash", "-k", "oldest", copy}, "no report of a scan");
  EXPECT_THAT(run(yes, ">/dev/full").errors, HasSubstr("\"orvane restore 2\" gives back"));
}

// A report whose files are no longer those that it names.
TEST_F(Orvane, TellsThatFilesWereNotMovedToTheTrash) {
  const std::string report = folder.write("report.json", R"({"schemaVersion": 1, "groups": [
      {"size": 4, "files": [{"path": ")" + folder.write("a", "same") +
                                                             R"(", "inode": 1,
                             "modified": "1.000000000"},
                            {"path": ")" + folder.write("b", "same") +
                                                             R"(", "inode": 2,
                             "modified": "1.000000000"}]}]})");
  const Outcome outcome = run({"trash", "--keep=oldest", "--yes", report});
  EXPECT_EQ(outcome.status, 3);
  EXPECT_THAT(outcome.output, AllOf(HasSubstr("[changed]"), HasSubstr("0 files were moved")));
}

TEST_F(Orvane, SharesTheExtentsOfDuplicates) {
  // Files in memory have none.
  const auto memory = Varnel::Tests::TemporaryFolder::inMemory();
  for (const char* name : {"a", "b"}) memory.write(name, "same");
  const Outcome unsupported = run({"share", memory.path()});
  EXPECT_EQ(unsupported.status, 1);
  EXPECT_THAT(unsupported.output, HasSubstr("/b [unsupported]\n\n0 files are shared now\n"));
  EXPECT_THAT(unsupported.errors, HasSubstr("no file system of these files"));

  const std::string reason = Varnel::Tests::enterMountNamespace();
  if (!reason.empty()) GTEST_SKIP() << reason;
  const Varnel::Tests::DiskImage image(home.path("image"), Varnel::Tests::DiskImage::btrfs());
  if (image.name().empty() || !image.mount(folder.path()))
    GTEST_SKIP() << "no mkfs.btrfs, or no loop devices";
  for (const char* name : {"a", "b", "c\n"}) folder.write(name, std::string(1 << 20, 'x'));
  const Outcome scan = run({"scan", "--json", folder.path()});
  const std::string report = home.path("report");
  std::ofstream(report) << scan.output;
  folder.write("b", std::string(1 << 20, 'y'));
  EXPECT_THAT(run({"share", "-n", report}).output,
              HasSubstr("1 file would be shared: 1 MB would be free\n"));
  const Outcome some = run({"share", report});
  EXPECT_EQ(some.status, 3);
  EXPECT_THAT(some.output,
              AllOf(HasSubstr("source  " + folder.path("a")),
                    HasSubstr("b [changed]\nshared  " + folder.path("c\\n")),
                    HasSubstr("\n1 file is shared now: 1 MB are free\n1 file stays as it is: ")));
  const Outcome again = run({"share", "--json", folder.path()});
  EXPECT_EQ(again.status, 0);
  EXPECT_THAT(again.output, AllOf(HasSubstr(R"("shared":0,"sharedBefore":1,"notShared":0)"),
                                  HasSubstr(R"("outcome":"shared before")")));
}

TEST(StepText, TellsWhyTheSystemRefused) {
  using Step = RemovalStep::Outcome;
  const auto code = [](std::errc error) { return std::make_error_code(error); };
  const std::vector<RemovalStep> steps = {
      {.outcome = Step::failed, .code = code(std::errc::no_space_on_device)},
      {.outcome = Step::changed, .code = code(std::errc::no_such_file_or_directory)},
      {.outcome = Step::failed, .code = code(std::errc::read_only_file_system)},
      {.outcome = Step::failed, .code = code(std::errc::no_space_on_device)}};
  const auto wordingOf = [](Step outcome) -> Wording {
    return {"", outcome == Step::failed ? "failed" : "changed"};
  };
  EXPECT_EQ(explanationsOf(steps, +wordingOf, "stays", "stay"),
            "1 stays: changed\n2 stay: failed (No space left on device)\n"
            "1 stays: failed (Read-only file system)\n");
}

TEST(TextColumns, CutTextsInTheirMiddle) {
  const struct {
    const char* text;
    std::size_t columns;
    const char* fitted;
  } rows[] = {
      {"/home/ann/a.jpg", 15, "/home/ann/a.jpg"},
      {"/home/ann/a.jpg", 14, "/ho...nn/a.jpg"},
      {"/home", 3, "..."},
      {"/home", 0, ""},
      {"日本語日本語", 12, "日本語日本語"},
      {"日本語日本語", 11, "日...日本語"},
      {"e\u0301e\u0301e\u0301e\u0301", 4, "e\u0301e\u0301e\u0301e\u0301"},
  };
  for (const auto& row : rows) {
    EXPECT_EQ(fitted(row.text, row.columns), row.fitted) << row.text;
    EXPECT_LE(columnsOf(fitted(row.text, row.columns)), row.columns);
    EXPECT_EQ(columnsOf(padded(row.fitted, row.columns)), row.columns);
  }
}

}  // namespace
}  // namespace Orvane::Testing
