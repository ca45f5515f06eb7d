// SPDX-License-Identifier: MIT
#pragma once

#include <gmock/gmock.h>

#include <cstdlib>
#include <fstream>
#include <functional>
#include <iterator>
#include <map>
#include <memory>
#include <optional>
#include <set>
#include <string>
#include <vector>

#include <Removal/PackagedFiles.h>
#include <Removal/Removal.h>
#include <Removal/Restoration.h>
#include <Tests/Programs/ScanFakes.h>
#include <Tests/Support/TemporaryFolder.h>
#include <Varnel/DiskAccess/DiskAccessManager.h>
#include <Varnel/Platform/Ports/Ports.h>
#include <Varnel/Platform/Testing/CapturedOutput.h>
#include <Varnel/Platform/Testing/FaultyPrivateFiles.h>
#include <Varnel/Platform/Testing/SimulatedClock.h>

namespace Orvane::Testing {

namespace fs = std::filesystem;
using Varnel::Platform::FileState;
using Varnel::Platform::Trash;
using Varnel::Platform::TrashedFile;
using Varnel::Platform::TrashError;
using Outcome = RemovalStep::Outcome;

/// The system's trash, and others who meddle.
class MeddledTrash final : public Trash {
 public:
  std::function<void()> beforeMove = [] {};  ///< Once all is compared.
  std::function<void()> afterNote = [] {};   ///< Right before the file is moved.
  std::function<void()> afterMove = [] {};
  std::optional<TrashError> answer{};              ///< To a move, which is not made then.
  std::map<std::string, std::uint64_t> devices{};  ///< Where given, of files.
  std::string folderWithoutTrash{};

  Varnel::Platform::Result<FileState, TrashError> state(const std::string& path) override {
    auto state = system_.state(path);
    if (state && devices.contains(path)) state->device = devices[path];
    return state;
  }
  bool isInTrash(const std::string& path) override { return system_.isInTrash(path); }
  Varnel::Platform::Result<std::string, TrashError> folderFor(const std::string& path) override {
    if (!folderWithoutTrash.empty() && path.starts_with(folderWithoutTrash))
      return TrashError{.reason = TrashError::Reason::noTrash};
    return system_.folderFor(path);
  }
  Varnel::Platform::Result<TrashedFile, TrashError> move(const std::string& path,
                                                         const FileState& expected,
                                                         const Ready& ready) override {
    beforeMove();
    if (answer) return *answer;
    auto moved = system_.move(path, expected, [&](const TrashedFile& planned) {
      const bool isReady = ready(planned);
      afterNote();
      return isReady;
    });
    afterMove();
    return moved;
  }
  std::optional<TrashError> restore(const TrashedFile& file, Folders folders) override {
    return system_.restore(file, folders);
  }
  Varnel::Platform::Result<std::vector<TrashedFile>, TrashError> contents(
      const std::string& folder) override {
    return system_.contents(folder);
  }

 private:
  Trash& system_ = Varnel::Platform::systemPorts().trash;
};

class NamedPackages final : public PackagedFiles {
 public:
  std::set<std::string> files{};
  std::error_code error{};

  Varnel::Platform::Result<std::set<std::string_view>, std::error_code> among(
      const std::set<std::string_view>& paths) override {
    if (error) return error;
    std::set<std::string_view> owned;
    for (const std::string_view path : paths)
      if (files.contains(std::string(path))) owned.insert(path);
    return owned;
  }
};

/// A home with a trash and a journal, and files in "files".
class RemovalFixture : public ::testing::Test {
 protected:
  RemovalFixture() {
    ::setenv("XDG_DATA_HOME", (home.path() / "data").c_str(), 1);
    Testing::FakeTurns::isInside() = true;  // Turns are the framework's own here.
  }

  std::string write(const std::string& name, std::string_view bytes) const {
    return home.write("files/" + name, bytes).string();
  }
  std::string path(const std::string& name) const { return home.path() / "files" / name; }
  static std::string bytes(const std::string& path) {
    std::ifstream file(path, std::ios::binary);
    if (!file) return "nothing";
    return {std::istreambuf_iterator<char>(file), {}};
  }

  /// The files as they are now. The first one shall stay.
  void report(const std::vector<std::string>& names) {
    ReportGroup group;
    for (const std::string& name : names) {
      const FileState state = *trash.state(path(name));
      group.size = state.size;
      group.files.push_back({.path = path(name),
                             .inode = state.inode,
                             .modified = state.modified,
                             .nanoseconds = state.nanoseconds});
    }
    Choice choice{.group = found.groups.size()};
    for (std::size_t i = 1; i < names.size(); ++i) choice.victims.push_back(i);
    found.groups.push_back(group);
    selection.push_back(choice);
  }

  Removal makeRemoval(Allowances allowances = {.hiddenFolders = true}) {
    return Removal({.fileSystem = fileSystem,
                    .disks = Varnel::DiskAccessManager::shared(),
                    .trash = trash,
                    .packagedFiles = packages,
                    .journal = journal,
                    .clock = clock},
                   found, selection, allowances, shouldStop);
  }

  static std::vector<Outcome> outcomes(const Removal& removal) {
    std::vector<Outcome> all;
    for (const RemovalStep& step : removal.steps()) all.push_back(step.outcome);
    return all;
  }

  /// Makes every step, and returns what came of each.
  std::vector<Outcome> removeAll(Allowances allowances = {.hiddenFolders = true}) {
    Removal removal = makeRemoval(allowances);
    EXPECT_FALSE(removal.prepare());
    EXPECT_FALSE(removal.begin());
    afterPreparing();
    while (removal.next()) continue;
    totals = removal.totals();
    return outcomes(removal);
  }

  std::vector<RestorationStep> restore(std::optional<std::int64_t> number = {}) {
    Restoration restoration(
        {.disks = Varnel::DiskAccessManager::shared(), .trash = trash, .journal = journal}, number);
    EXPECT_FALSE(restoration.begin());
    while (restoration.next()) continue;
    return restoration.steps();
  }

  std::vector<TrashedFile> trashed() { return *trash.contents(home.path() / "data" / "Trash"); }

  /// How often the bytes are in the trash, and in the journal.
  int copiesInTrash(const std::string& content) {
    std::set<std::string> noted;
    const std::vector<RemovalRecord> removals = *journal.removals();
    for (const RemovalRecord& removal : removals) {
      const std::vector<RemovalJournal::Entry> entries = *journal.entries(removal);
      for (const auto& entry : entries) noted.insert(placeOf(entry.file));
    }
    int copies = 0;
    for (const TrashedFile& file : trashed())
      if (bytes(placeOf(file)) == content && noted.contains(placeOf(file))) ++copies;
    return copies;
  }
  static std::string placeOf(const TrashedFile& file) {
    return file.folder + "/files/" + file.name;
  }

  const Varnel::Tests::TemporaryFolder home = Varnel::Tests::TemporaryFolder::inMemory();
  FaultyFileSystem fileSystem;
  MeddledTrash trash;
  NamedPackages packages;
  Varnel::Platform::Testing::FaultyPrivateFiles privateFiles{
      Varnel::Platform::systemPorts().privateFiles};
  Varnel::Platform::Testing::CapturedSystemLog systemLog;
  Varnel::Platform::Testing::SimulatedClock clock;
  const std::string journalPath = home.path() / "state" / "removals.sqlite";
  RemovalJournal journal{{privateFiles, systemLog}, journalPath};
  std::atomic<bool> shouldStop{false};
  std::function<void()> afterPreparing = [] {};
  Report found;
  Selection selection;
  RemovalTotals totals;
};

}  // namespace Orvane::Testing
