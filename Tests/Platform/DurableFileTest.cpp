// SPDX-License-Identifier: MIT
#include <Varnel/Platform/SQLite/DurableFile.h>

#include <gtest/gtest.h>

#include <Tests/Support/TemporaryFolder.h>
#include <Varnel/Platform/POSIX/Adapters.h>
#include <Varnel/Platform/Ports/SystemLog.h>

namespace Varnel::Tests {
namespace {

namespace fs = std::filesystem;
using namespace Platform;
using Journal = DurableFormat::Journal;
using Failure = std::optional<PlatformError>;

class Lines final : public SystemLog {
 public:
  void write(std::string_view line) override { lines.emplace_back(line); }
  std::vector<std::string> lines;
};

DurableFormat notes(Journal journal) {
  return {.subject = "notes",
          .applicationID = 0x4E4F5445,
          .version = {1, 0},
          .schema = "CREATE TABLE note(id INTEGER PRIMARY KEY, key TEXT NOT NULL UNIQUE)",
          .migrations = {},
          .journal = journal,
          .synchronisation = DurableFormat::Synchronisation::survivesKill,
          .tables = {{"note", {"key"}}}};
}

class DurableFileTest : public testing::TestWithParam<Journal> {
 protected:
  std::unique_ptr<DurableFile> open() {
    return std::make_unique<DurableFile>(DurableFile::Ports{*files_, log_}, path_.string(),
                                         notes(GetParam()), Migrating::allowed);
  }

  static Failure add(DurableFile& file, const std::string& key) {
    return file.changeByOneStatement([&](SQLiteDatabase& database) -> Failure {
      const auto insert = database.cached("INSERT OR IGNORE INTO note(key) VALUES(?)");
      if (!insert) return insert.error();
      (*insert)->bind(1, key);
      const auto step = (*insert)->step();
      return step ? Failure() : step.error();
    });
  }

  static std::string keys(DurableFile& file) {
    std::string found;
    const auto error = file.read([&](SQLiteDatabase& database) -> Failure {
      found.clear();
      const auto rows = database.cached("SELECT key FROM note ORDER BY key");
      if (!rows) return rows.error();
      while (true) {
        const auto step = (*rows)->step();
        if (!step) return step.error();
        if (*step == SQLiteStatement::Step::done) return std::nullopt;
        found += (*rows)->text(0).value_or("");
      }
    });
    return error ? error->description() : found;
  }

  TemporaryFolder folder_;
  const fs::path path_ = folder_.path() / "state" / "notes.sqlite";
  std::unique_ptr<PrivateFiles> files_ = POSIX::makePrivateFiles();
  Lines log_;
};

INSTANTIATE_TEST_SUITE_P(, DurableFileTest, testing::Values(Journal::rollback, Journal::writeAhead),
                         [](const auto& one) {
                           return one.param == Journal::rollback ? "Rollback" : "WriteAhead";
                         });

TEST_P(DurableFileTest, KeepsWhatIsTakenAwayUnderIt) {
  struct Case {
    const char* what;
    std::function<void(const fs::path&)> act;
  };
  const std::vector<Case> cases{
      {"removed", [](const fs::path& path) { fs::remove(path); }},
      {"renamed", [](const fs::path& path) { fs::rename(path, path.string() + ".away"); }},
      {"emptied", [](const fs::path& path) { fs::resize_file(path, 0); }},
      {"removed with its journals",
       [](const fs::path& path) {
         for (const char* suffix : {"", "-wal", "-shm", "-journal"})
           fs::remove(path.string() + suffix);
       }},
  };
  for (const Case& one : cases) {
    SCOPED_TRACE(one.what);
    fs::remove_all(path_.parent_path());
    auto file = open();
    EXPECT_FALSE(add(*file, "a"));
    one.act(path_);
    EXPECT_FALSE(add(*file, "b"));
    const bool isReadable = GetParam() == Journal::writeAhead || std::string(one.what) != "emptied";
    EXPECT_EQ(keys(*file), isReadable ? "ab" : "b");
    EXPECT_EQ(keys(*open()), isReadable ? "ab" : "b");
    EXPECT_EQ(file->damageCount(), 1);
  }
}

}  // namespace
}  // namespace Varnel::Tests
