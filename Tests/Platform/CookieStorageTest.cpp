// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Generic/SQLiteCookieStorage.h>

#include <gmock/gmock.h>
#include <sqlite3.h>

#include <memory>

#include <Tests/Support/OpenDescriptors.h>
#include <Tests/Support/OtherProcess.h>
#include <Tests/Support/TemporaryFolder.h>
#include <Varnel/Platform/SQLite/SQLiteDatabase.h>
#include <Varnel/Platform/Testing/SimulatedClock.h>

namespace Varnel::Platform {
namespace {

namespace fs = std::filesystem;
using testing::ElementsAre;

const std::string createTable =
    "CREATE TABLE moz_cookies (id INTEGER PRIMARY KEY, name, value, expiry, host, path);";
const std::string insert = "INSERT INTO moz_cookies(id, name, value, expiry) VALUES ";

class CookieJar : public testing::Test {
 protected:
  static std::unique_ptr<SQLiteDatabase> open(const fs::path& file) {
    fs::create_directories(file.parent_path());
    return std::make_unique<SQLiteDatabase>(
        *SQLiteDatabase::open(file.string(), SQLiteDatabase::Access::readWrite));
  }

  // The names and values of the group's cookies. Nothing may stay open.
  std::vector<std::string> read() {
    const auto descriptors = Tests::openDescriptors();
    const auto memory = ::sqlite3_memory_used();
    std::vector<std::string> lines;
    for (const Cookie& cookie : storage.cookiesOfGroupContainer("Cookies"))
      lines.push_back(cookie.name + "=" + cookie.value);
    EXPECT_EQ(Tests::openDescriptors(), descriptors);
    EXPECT_EQ(::sqlite3_memory_used(), memory);
    return lines;
  }

  const Tests::TemporaryFolder folder;
  Testing::SimulatedClock clock{Date(std::chrono::seconds(1000))};
  SQLiteCookieStorage storage{folder.path(), "orvane", clock};
  const fs::path groupJar = folder.path() / "group-containers" / "Cookies" / "cookies.sqlite";
};

TEST_F(CookieJar, ListsWhatHasNotExpiredInTheOrderOfTheStore) {
  ASSERT_FALSE(open(groupJar)->execute(createTable + insert +
                                       "(2, 'b', '2', 1001), (1, 'a', '1', 2000),"
                                       "(3, 'c', '3', 1000), (4, 'd', NULL, 1500)"));
  EXPECT_THAT(read(), ElementsAre("a=1", "b=2", "d="));
  clock.advance(std::chrono::seconds(1));
  EXPECT_THAT(read(), ElementsAre("a=1", "d="));
}

TEST_F(CookieJar, ADamagedStoreIsEmpty) {
  for (const std::string& bytes : {std::string(5000, 'x'), std::string()}) {
    folder.write("group-containers/Cookies/cookies.sqlite", bytes);
    EXPECT_THAT(read(), ElementsAre());
  }
  ASSERT_FALSE(open(groupJar)->execute("CREATE TABLE moz_cookies (name TEXT)"));
  EXPECT_THAT(read(), ElementsAre());
}

// What is committed but still in the log beside the file counts; what is being written does not.
TEST_F(CookieJar, AJarThatAnotherProcessWritesIsReadAtItsLastCommit) {
  ASSERT_FALSE(open(groupJar)->execute("PRAGMA journal_mode = WAL;" + createTable));
  const Tests::OtherProcess browser([&] {
    auto writer = open(groupJar);
    const auto failed = writer->execute("PRAGMA wal_autocheckpoint = 0;" + insert +
                                        "(1, 'committed', '1', 2000); BEGIN IMMEDIATE;" + insert +
                                        "(2, 'pending', '2', 2000)");
    return failed ? nullptr : std::move(writer);
  });
  ASSERT_TRUE(browser.isReady());
  ASSERT_GT(fs::file_size(groupJar.string() + "-wal"), 0U);
  EXPECT_THAT(read(), ElementsAre("committed=1"));
}

}  // namespace
}  // namespace Varnel::Platform
