// SPDX-License-Identifier: MIT
#include <Varnel/Platform/SQLite/SQLiteDatabase.h>

#include <gtest/gtest.h>

#include <Tests/Support/TemporaryFolder.h>

namespace Varnel::Tests {
namespace {

using namespace Platform;

struct Values {
  std::optional<std::string> text;
  std::optional<Date> date;
  std::optional<std::int64_t> number;

  bool operator==(const Values&) const = default;
};

TEST(SQLiteDatabase, ReadsBackWhatItBound) {
  auto database = *SQLiteDatabase::open(":memory:");
  ASSERT_FALSE(database.execute("CREATE TABLE kept(id INTEGER PRIMARY KEY, t, d, n)"));
  const std::vector<Values> rows{{},
                                 {.text = "", .date = Date(), .number = 0},
                                 {.text = "ä", .date = Date::min(), .number = -1}};
  for (const Values& row : rows)
    EXPECT_FALSE(
        database.run("INSERT INTO kept(t, d, n) VALUES(?, ?, ?)", row.text, row.date, row.number));
  std::vector<Values> found;
  EXPECT_FALSE(database.each(
      "SELECT t, d, n FROM kept WHERE id > ? ORDER BY id",
      [&](SQLiteStatement& row) {
        // What was there before must go where the row has nothing.
        Values values{.text = "x", .date = Date::max(), .number = 7};
        row.read(std::tie(values.text, values.date, values.number));
        found.push_back(values);
      },
      0));
  EXPECT_EQ(found, rows);

  std::string text = "stays";
  int number = 5;
  for (const char* sql : {"SELECT t, n FROM kept WHERE id = 1", "SELECT t, n FROM kept WHERE 0"}) {
    EXPECT_FALSE(database.row(sql, std::tie(text, number)));
    EXPECT_EQ(text + std::to_string(number), "stays5") << sql;
  }
  EXPECT_TRUE(database.run("INSERT INTO kept(id) VALUES(?)", 1));
  EXPECT_FALSE(database.run("INSERT INTO kept(id) VALUES(?)", 9)) << "the failure is over";
}

TEST(SQLiteDatabase, NoStatementKeepsItsLocks) {
  const TemporaryFolder folder;
  const std::string path = folder.path() / "kept.sqlite";
  auto one = *SQLiteDatabase::open(path);
  auto other = *SQLiteDatabase::open(path);
  ASSERT_FALSE(
      one.execute("CREATE TABLE kept(id INTEGER PRIMARY KEY); INSERT INTO kept VALUES(1)"));
  int id = 0;
  EXPECT_FALSE(one.row("SELECT id FROM kept", std::tie(id)));
  EXPECT_FALSE(other.run("INSERT INTO kept VALUES(?)", 2));
  EXPECT_THROW(
      static_cast<void>(one.each("SELECT id FROM kept", [](SQLiteStatement&) { throw 0; })), int);
  EXPECT_FALSE(other.run("INSERT INTO kept VALUES(?)", 3));
}

}  // namespace
}  // namespace Varnel::Tests
