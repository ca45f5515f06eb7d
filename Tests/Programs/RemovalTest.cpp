// SPDX-License-Identifier: MIT
#include <Removal/DpkgFiles.h>
#include <Tests/Programs/RemovalFixture.h>

namespace Orvane::Testing {
namespace {

using enum RemovalStep::Outcome;
using ::testing::ElementsAre;
using ::testing::IsEmpty;
using RestoreOutcome = RestorationStep::Outcome;

std::vector<RestoreOutcome> outcomesOf(const std::vector<RestorationStep>& steps) {
  std::vector<RestoreOutcome> all;
  for (const RestorationStep& step : steps) all.push_back(step.outcome);
  return all;
}

TEST_F(RemovalFixture, MovesAllButTheFileThatStaysAndGivesThemBack) {
  const std::string large(3 << 20, 'x');
  for (const char* name : {"a", "b", "folder/c", "large", "large copy"})
    write(name, std::string_view(name).starts_with("large") ? large : "same");
  report({"b", "a", "folder/c"});
  report({"large copy", "large"});
  EXPECT_THAT(removeAll(), ElementsAre(moved, moved, moved));
  EXPECT_EQ(totals.freedBytes, 8 + large.size());
  EXPECT_EQ(copiesInTrash("same") + copiesInTrash(large), 3);
  EXPECT_EQ(bytes(path("b")), "same");
  EXPECT_FALSE(fs::exists(path("a")));

  fs::remove(path("folder"));
  EXPECT_THAT(outcomesOf(restore()), ElementsAre(RestoreOutcome::restored, RestoreOutcome::restored,
                                                 RestoreOutcome::restored));
  EXPECT_EQ(bytes(path("a")) + bytes(path("folder/c")) + bytes(path("large")), "samesame" + large);
  EXPECT_EQ(journal.removals()->at(0).restored, 3u);
}

// What somebody does between the report and the move, and what becomes of both files.
TEST_F(RemovalFixture, LeavesWhatIsNotAsItWas) {
  const auto append = [](const std::string& file) { std::ofstream(file, std::ios::app) << "!"; };
  const auto rewrite = [](const std::string& file) {
    const auto time = fs::last_write_time(file);
    std::ofstream(file) << "SAME";
    fs::last_write_time(file, time);
  };
  const auto remove = [](const std::string& file) { fs::remove(file); };
  const auto swapForLink = [](const std::string& file) {
    fs::rename(file, file + " away");
    fs::create_symlink(file + " away", file);
  };
  const auto swapFolderForLink = [](const std::string& file) {
    const fs::path folder = fs::path(file).parent_path();
    fs::rename(folder, folder.string() + " away");
    fs::create_directory_symlink(folder.string() + " away", folder);
  };
  const auto swapForEqual = [](const std::string& file) {
    fs::copy_file(file, file + " new");
    fs::last_write_time(file + " new", fs::last_write_time(file));
    fs::rename(file + " new", file);
  };
  const auto linkToThird = [this](const std::string& file) {
    fs::remove(file);
    fs::create_hard_link(path("3/f"), file);
  };
  const struct {
    const char* what;
    std::function<void(const std::string&)> meddle;
    Outcome outcome;
    int left = 3;
  } rows[] = {
      {"grows", append, changed},
      {"is rewritten at its old time", rewrite, different},
      {"vanishes", remove, changed, 2},
      {"becomes a link", swapForLink, changed},
      {"lies behind a link", swapFolderForLink, changed},
      {"is replaced by an equal one", swapForEqual, changed},
      {"becomes another of the group", linkToThird, changed},
  };
  std::function<void()> atOnce = [] {}, whileCompared = [] {};
  fileSystem.beforeRead = [&](const std::string&) { std::exchange(whileCompared, [] {})(); };
  for (const auto& row : rows) {
    for (const std::string who : {"1", "2"}) {
      for (auto* moment :
           {&atOnce, &afterPreparing, &whileCompared, &trash.beforeMove, &trash.afterNote}) {
        SCOPED_TRACE(std::string(row.what) + ", file " + who);
        fs::remove_all(home.path() / "files");
        fs::remove_all(home.path() / "data");
        found.groups.clear();
        selection.clear();
        for (const char* name : {"1/f", "2/f", "3/f"}) write(name, "same");
        report({"1/f", "2/f", "3/f"});
        bool isDone = false;
        *moment = [&] {
          if (!std::exchange(isDone, true)) row.meddle(path(who + "/f"));
        };
        atOnce();
        const std::vector<Outcome> all = removeAll();
        *moment = [] {};
        // What comes once all is compared can be too late: then it is in the trash.
        const bool isLate = moment == &trash.beforeMove || moment == &trash.afterNote;
        if (!isLate || all.at(0) != moved) {
          EXPECT_EQ(all.at(0), row.outcome);
          EXPECT_EQ(all.at(1), changed);
        }
        int left = copiesInTrash("same") + copiesInTrash("SAME") + copiesInTrash("same!");
        for (const auto& entry : fs::recursive_directory_iterator(home.path() / "files"))
          left += entry.is_regular_file() && !entry.is_symlink() ? 1 : 0;
        EXPECT_EQ(left, row.left);
      }
    }
  }
}

TEST_F(RemovalFixture, LeavesWhatCannotBeComparedOrNoted) {
  write("a", "same"), write("b", "same"), write("c", "same"), write("d", "same");
  report({"a", "b"});
  report({"c", "d"});
  fileSystem.openFaults[path("b")] = std::errc::permission_denied;
  fileSystem.readFaults[path("c")] = std::errc::io_error;
  EXPECT_THAT(removeAll(), ElementsAre(unreadable, unreadable));

  fileSystem.openFaults.clear();
  fileSystem.readFaults.clear();
  for (const auto& [reason, outcome] :
       {std::pair{TrashError::Reason::noTrash, noTrash}, {TrashError::Reason::failed, failed}}) {
    trash.answer = TrashError{.reason = reason};
    EXPECT_THAT(removeAll(), ElementsAre(outcome, outcome));
  }
  EXPECT_THAT(*journal.removals(), IsEmpty());
  const TrashedFile stranger{.folder = "/trash", .name = "b", .path = path("b"), .state = {}};
  trash.answer = TrashError{.reason = TrashError::Reason::misplaced, .file = stranger};
  EXPECT_THAT(removeAll(), ElementsAre(misplaced, misplaced));
  EXPECT_EQ(journal.entries(journal.removals()->at(0))->at(0).file, stranger);
  trash.answer.reset();

  using Varnel::Platform::Testing::Fault;
  trash.beforeMove = [&] { privateFiles.faults->plan(Fault::fails, 1); };
  EXPECT_THAT(removeAll(), ElementsAre(notJournalled, notJournalled));
  privateFiles.faults->mend();
  trash.beforeMove = [&] { shouldStop = true; };
  EXPECT_THAT(removeAll(), ElementsAre(moved, stopped));
  EXPECT_EQ(totals.notMoved, 1u);
  EXPECT_EQ(copiesInTrash("same"), 1);
  Removal unseen = makeRemoval();
  EXPECT_FALSE(unseen.prepare());
  EXPECT_THAT(outcomes(unseen), ElementsAre(stopped, stopped));
}

TEST_F(RemovalFixture, LeavesWhatIsNoCopy) {
  const std::string large(3 << 20, 'x');
  write("large", large + "1"), write("large, changed", large + "2");
  report({"large", "large, changed"});
  write("a", "same");
  for (const char* name : {"hard link", "seen through another mount"}) {
    fs::create_hard_link(path("a"), path(name));
    report({"a", name});
  }
  fileSystem.devices[path("seen through another mount")] = 77;
  trash.devices = fileSystem.devices;
  EXPECT_THAT(removeAll({.otherFileSystems = true, .hardLinks = true}),
              ElementsAre(different, different, different));
}

TEST_F(RemovalFixture, KnowsFilesByTheirNumbersWhereThoseLast) {
  write("a", "same"), write("b", "same");
  report({"a", "b"});
  for (ReportFile& file : found.groups[0].files) ++file.inode;
  EXPECT_THAT(removeAll(), ElementsAre(changed));
  fileSystem.keepsNumbers = false;
  EXPECT_THAT(removeAll(), ElementsAre(moved));
}

TEST_F(RemovalFixture, PutsBackWhatHasBecomeTheLastOne) {
  for (const char* name : {"a", "b", "c"}) write(name, "same");
  report({"a", "b", "c"});
  // The second: one file in two views, of which one remembers for a while what it has shown.
  for (const bool isRemembered : {false, true}) {
    trash.afterMove = [&] {
      if (!isRemembered) fs::rename(path("a"), path("away"));
      if (isRemembered) fileSystem.openFaults[path("a")] = std::errc::no_such_file_or_directory;
    };
    EXPECT_THAT(removeAll(), ElementsAre(changed, changed));
    EXPECT_EQ(bytes(path("b")) + bytes(path("c")), "samesame");
    EXPECT_THAT(*journal.removals(), IsEmpty());
    if (!isRemembered) fs::rename(path("away"), path("a"));
  }
  fileSystem.openFaults.clear();
  trash.afterMove = [] {};

  write("a", "same");
  selection.clear();
  report({"a", "b"});
  selection[0].group = 1;
  trash.afterNote = [&] { write("b", "new"); };
  EXPECT_THAT(removeAll(), ElementsAre(changed));
  EXPECT_THAT(*journal.removals(), IsEmpty()) << "of what was not moved there is no note";
}

TEST_F(RemovalFixture, CountsWhatIsFreedAsScansDo) {
  constexpr std::uint64_t size = 8192;
  const SharedExtents first{.bytes = size, .place = 1}, second{.bytes = size, .place = 2},
      half{.bytes = size / 2, .place = 3};
  const struct {
    std::map<std::string, SharedExtents> shared;  ///< Of "a", which stays, "b" and "c".
    std::uint64_t freedBytes;
  } rows[] = {
      {{}, 2 * size},
      {{{"a", first}, {"b", first}}, size},
      {{{"a", first}, {"b", first}, {"c", first}}, 0},
      {{{"b", second}, {"c", second}}, size},
      {{{"b", half}}, size + size / 2},
  };
  for (const auto& [shared, freedBytes] : rows) {
    found.groups.clear();
    selection.clear();
    for (const char* name : {"a", "b", "c"}) write(name, std::string(size, 'x'));
    report({"a", "b", "c"});
    fileSystem.shared = {{path(""), {}}};
    for (const auto& [name, extents] : shared) fileSystem.shared[path(name)] = extents;
    Removal removal = makeRemoval();
    ASSERT_FALSE(removal.prepare());
    EXPECT_EQ(removal.totals().plannedBytes, freedBytes);
    EXPECT_THAT(removeAll(), ElementsAre(moved, moved));
    EXPECT_EQ(totals.freedBytes, freedBytes);
  }
  for (const char* name : {"a", "b", "c"}) fs::resize_file(write(name, ""), size);
  found.groups.clear();
  selection.clear();
  report({"a", "b", "c"});
  removeAll();
  EXPECT_EQ(totals.freedBytes, 0u) << "in holes";
}

TEST_F(RemovalFixture, MovesOnlyWhatIsAllowed) {
  for (const char* name : {"a", ".hidden/b", "c", "d", "e", ".f"}) write(name, "same");
  fs::create_hard_link(path("e"), path("other e"));
  fs::create_hard_link(path("e"), path("third e"));
  report({"a", ".hidden/b", "c", "d", "e", ".f"});
  found.groups[0].files[4].names = {path("other e")};
  trash.devices[path("c")] = 77;
  packages.files = {path("d")};

  Removal careful = makeRemoval({});
  ASSERT_FALSE(careful.prepare());
  EXPECT_THAT(outcomes(careful),
              ElementsAre(inHiddenFolder, onOtherFileSystem, packaged, hardLinked, planned));
  EXPECT_EQ(careful.totals().plannedBytes, 4u);
  Removal allowed = makeRemoval({true, true, true, true});
  ASSERT_FALSE(allowed.prepare());
  EXPECT_THAT(outcomes(allowed), ElementsAre(planned, planned, planned, planned, planned, planned));
  EXPECT_EQ(allowed.pathOf(allowed.steps()[4]), path("other e"));
  EXPECT_EQ(allowed.steps()[4].otherNames, 1u);
  EXPECT_EQ(allowed.totals().plannedBytes, 16u) << "the third name keeps those of e";

  // A folder that was named to the scan is no secret, what is hidden in it is.
  for (const auto& [root, outcome] :
       {std::pair{path(".hidden"), planned}, {path("") + "/", inHiddenFolder}}) {
    found.roots = {root};
    Removal named = makeRemoval({});
    ASSERT_FALSE(named.prepare());
    EXPECT_EQ(outcomes(named).at(0), outcome) << root;
  }
}

// Or else emptying the trash would take the last one.
TEST_F(RemovalFixture, CountsOnNothingThatIsInATrash) {
  for (const std::string old : {".Trash-1000/files/a", ".local/share/Trash/files/a",
                                "$RECYCLE.BIN/S-1/$RA.jpg", "user/.Trashes/501/a"}) {
    write(old, "same"), write("b", "same");
    found.groups.clear();
    report({old, "b"});
    for (const Choice& choice : {Choice{.kept = 0, .victims = {1}}, {.kept = 1, .victims = {0}}}) {
      selection = {choice};
      EXPECT_THAT(removeAll(), ElementsAre(inTrash)) << old;
      EXPECT_EQ(bytes(path("b")) + bytes(path(old)), "samesame");
    }
  }
}

TEST_F(RemovalFixture, BeginsOnlyWhereItCanEnd) {
  write("a", "same"), write("b", "same");
  report({"a", "b"});
  const auto problemOf = [&]() -> std::optional<Removal::Problem::Reason> {
    Removal removal = makeRemoval();
    auto problem = removal.prepare();
    if (!problem) problem = removal.begin();
    return problem ? std::optional(problem->reason) : std::nullopt;
  };
  using Reason = Removal::Problem::Reason;
  packages.error = std::make_error_code(std::errc::permission_denied);
  EXPECT_EQ(problemOf(), Reason::packages);
  packages.error = {};
  trash.folderWithoutTrash = path("");
  EXPECT_EQ(problemOf(), Reason::noTrash);
  trash.folderWithoutTrash.clear();
  {
    const auto lock = journal.lock();
    EXPECT_EQ(problemOf(), Reason::busy);
    Restoration restoration(
        {.disks = Varnel::DiskAccessManager::shared(), .trash = trash, .journal = journal}, {});
    EXPECT_EQ(restoration.begin()->reason, Restoration::Problem::Reason::busy);
  }
  selection[0].kept = 1;
  EXPECT_EQ(problemOf(), Reason::selection);
  selection[0].kept = 0;
  fs::remove_all(home.path() / "state");
  home.write("state", "a file in the place of the folder");
  EXPECT_EQ(problemOf(), Reason::journal);
  EXPECT_EQ(bytes(path("b")), "same");
}

TEST_F(RemovalFixture, RestoresOnlyWhatCanComeBack) {
  for (const char* name : {"a", "b", "c", "d", "e"}) write(name, "same");
  report({"a", "b", "c", "d", "e"});
  const auto timeOfD = fs::last_write_time(path("d"));
  // The process ends right before the last move.
  int notes = 0;
  struct Killed {};
  trash.afterNote = [&] {
    if (++notes == 4) throw Killed();
  };
  EXPECT_THROW(removeAll(), Killed);
  trash.afterNote = [] {};
  EXPECT_EQ(copiesInTrash("same"), 3);

  const TrashedFile fileC = trashed().at(1);
  for (const char* part : {"/info/c.trashinfo", "/files/c"})
    fs::rename(fileC.folder + part, fileC.folder + part + " away");
  write("d", "new");
  fs::last_write_time(path("d"), timeOfD);
  EXPECT_THAT(outcomesOf(restore()),
              ElementsAre(RestoreOutcome::inPlace, RestoreOutcome::occupied,
                          RestoreOutcome::emptied, RestoreOutcome::restored));
  EXPECT_EQ(bytes(path("d")), "new");
  fs::remove(path("d"));
  fs::rename(home.path() / "data", home.path() / "disk that is not there");
  EXPECT_THAT(outcomesOf(restore(1)),
              ElementsAre(RestoreOutcome::noTrash, RestoreOutcome::noTrash));
  fs::remove_all(home.path() / "data");
  fs::rename(home.path() / "disk that is not there", home.path() / "data");
  for (const char* part : {"/info/c.trashinfo", "/files/c"})
    fs::rename(fileC.folder + part + " away", fileC.folder + part);
  EXPECT_THAT(outcomesOf(restore(1)),
              ElementsAre(RestoreOutcome::restored, RestoreOutcome::restored));
  EXPECT_THAT(restore(1), IsEmpty());
  Restoration none(
      {.disks = Varnel::DiskAccessManager::shared(), .trash = trash, .journal = journal}, {});
  EXPECT_EQ(none.begin()->reason, Restoration::Problem::Reason::unknown);
}

TEST_F(RemovalFixture, IsKnownUntilNothingIsLeftOfIt) {
  write("a", "same");
  const auto removeB = [&] {
    found.groups.clear();
    selection.clear();
    write("b", "same");
    report({"a", "b"});
    EXPECT_THAT(removeAll(), ElementsAre(moved));
  };
  removeB(), removeB();
  for (int removal = 2; removal > 0; --removal) {
    EXPECT_THAT(outcomesOf(restore()), ElementsAre(RestoreOutcome::restored)) << removal;
    fs::remove(path("b"));
  }
  removeB();
  ASSERT_EQ(journal.removals()->size(), 1u);
  EXPECT_EQ(journal.removals()->at(0).number, 3);
}

TEST(DpkgFiles, AreThoseOfTheLists) {
  const Varnel::Tests::TemporaryFolder dpkg;
  fs::create_directories(dpkg.path() / "usr/bin");
  fs::create_directory_symlink(dpkg.path() / "usr/bin", dpkg.path() / "bin");
  const std::string program = dpkg.write("usr/bin/program", ""), root = dpkg.path();
  EXPECT_THAT(*DpkgFiles(dpkg.path()).among({program}), IsEmpty());
  dpkg.write("info/one.list", "/.\n" + root + "/bin/program\nprogram\n" + root + "/gone\n");
  dpkg.write("info/one.md5sums", root + "/other\n");
  dpkg.write("diversions", root + "/a\n" + root + "/a.distrib\none\n");
  const std::string other = root + "/other", gone = root + "/gone", diverted = root + "/a.distrib";
  EXPECT_THAT(*DpkgFiles(dpkg.path()).among({program, other, gone, diverted}),
              ElementsAre(diverted, gone, program));
  fs::create_directory(dpkg.path() / "info/two.list");
  EXPECT_FALSE(DpkgFiles(dpkg.path()).among({program}));
}

}  // namespace
}  // namespace Orvane::Testing
