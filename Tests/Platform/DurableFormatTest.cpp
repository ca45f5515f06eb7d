// SPDX-License-Identifier: MIT
#include <Tests/Platform/DurableNotes.h>
#include <Tests/Support/TemporaryFolder.h>

namespace Varnel::Tests {
namespace {

namespace fs = std::filesystem;
using namespace Platform;

// One file of each format that ever was lies in Data.
TEST(DurableFormatTest, OnlyTheProductsOwnHostMigrates) {
  const auto later = [](FormatVersion version) {
    DurableFormat format = notes(Journal::rollback);
    format.version = version;
    format.migrations = {
        {{1, 0}, "ALTER TABLE note ADD COLUMN text TEXT NOT NULL DEFAULT 'none'"},
        {{1, 1}, "CREATE TABLE place(name TEXT); DELETE FROM note WHERE key = 'b'"}};
    return format;
  };
  auto broken = later({2, 0});
  broken.migrations[1].sql += "; nonsense";
  struct Case {
    const char* what;
    DurableFormat format;
    Migrating migrating;
    const char* keys;
    std::int64_t version;
  };
  const std::vector<Case> cases{
      {"the same", later({1, 0}), Migrating::allowed, "abc", 1000},
      {"a later minor, its own host", later({1, 1}), Migrating::allowed, "abc", 1001},
      {"a later minor, another", later({1, 1}), Migrating::never, "abc", 1000},
      {"a later major, its own host", later({2, 0}), Migrating::allowed, "ac", 2000},
      {"a later major, another", later({2, 0}), Migrating::never, "older", 1000},
      {"an earlier major", later({0, 9}), Migrating::allowed, "newer", 1000},
      {"a migration that fails", broken, Migrating::allowed, nullptr, 1000},
  };
  const fs::path golden = fs::path(VARNEL_TEST_DATA) / "notes-1.0.sqlite";
  for (const Case& one : cases) {
    SCOPED_TRACE(one.what);
    const TemporaryFolder folder;
    const fs::path path = folder.path() / "notes.sqlite";
    fs::copy_file(golden, path);
    Notebook book(path, one.format, one.migrating);
    const std::string keys = book.keys();
    EXPECT_TRUE(one.keys ? keys == one.keys : keys.find("nonsense") != keys.npos) << keys;
    auto database = SQLiteDatabase::open(path, SQLiteDatabase::Access::readOnly);
    int version = 0;
    int count = 0;
    EXPECT_FALSE(database->row("PRAGMA user_version", std::tie(version)));
    EXPECT_FALSE(database->row("SELECT count(*) FROM note", std::tie(count)));
    EXPECT_EQ(version, one.version);
    EXPECT_EQ(count, version == 2000 ? 2 : 3);
    EXPECT_FALSE(fs::exists(path.string() + ".damaged"));
    // One who has the file open meanwhile notices, and one of an earlier minor version goes on.
    Notebook old(path, notes(Journal::rollback), Migrating::never);
    Notebook(path, later({1, 1}), Migrating::allowed).keys();
    EXPECT_EQ(old.change("e"), one.version == 2000 ? "newer" : "kept");
    Notebook(path, later({2, 0}), Migrating::allowed).keys();
    for (int time = 0; time < 3; ++time) EXPECT_EQ(old.change("f"), "newer");
    EXPECT_EQ(old.log.lines.size(), 1u);
  }
}

TEST(DurableFormatTest, AStatementNoticesThatAnotherHasMigratedTheFile) {
  for (const Journal journal : {Journal::rollback, Journal::writeAhead}) {
    const TemporaryFolder folder;
    const fs::path path = folder.path() / "notes.sqlite";
    Notebook book(path, notes(journal));
    ASSERT_EQ(book.add("a"), "kept");
    auto other = SQLiteDatabase::open(path, SQLiteDatabase::Access::readWrite);
    EXPECT_FALSE(other->execute("ALTER TABLE note RENAME TO page; PRAGMA user_version = 2000"));
    EXPECT_EQ(book.add("b"), "newer");
  }
}

}  // namespace
}  // namespace Varnel::Tests
