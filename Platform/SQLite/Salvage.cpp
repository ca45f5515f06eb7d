// SPDX-License-Identifier: MIT
#include <Varnel/Platform/SQLite/Salvage.h>

#include <sqlite3.h>

#include <set>

#include <Varnel/Platform/SQLite/SQLiteDatabase.h>
#include <Varnel/Platform/SQLite/SQLiteFailure.h>
#include <fmt/format.h>
#include <fmt/ranges.h>

namespace Varnel::Platform {
namespace {

using Failure = std::optional<PlatformError>;
using Step = SQLiteStatement::Step;

// Whether it is the file that cannot be read: a lock, a lack of room, memory or descriptors passes.
bool showsDamage(const PlatformError& error) {
  const SQLiteFailure meaning = meaningOf(error);
  const long code = error.code() & 0xff;
  return meaning == SQLiteFailure::damaged ||
         (meaning == SQLiteFailure::other && (code == SQLITE_ERROR || code == SQLITE_IOERR));
}

// None where the table cannot be read at all.
Result<std::set<std::string>> columnsOf(SQLiteDatabase& database, const std::string& table) {
  std::set<std::string> columns;
  const auto error = database.each(
      "SELECT name FROM pragma_table_info(?)",
      [&](SQLiteStatement& row) { columns.emplace(row.text(0).value_or("")); }, table);
  if (error && !showsDamage(*error)) return *error;
  return columns;
}

// Those columns that both files have: the damaged one may be of another version.
Result<std::vector<std::string>> sharedColumns(SQLiteDatabase& from, SQLiteDatabase& to,
                                               const SavedTable& table) {
  const auto here = columnsOf(from, table.name);
  if (!here) return here.error();
  const auto there = columnsOf(to, table.name);
  if (!there) return there.error();
  std::vector<std::string> columns;
  for (const std::string& column : *here)
    if (there->contains(column) && column != table.ownNumber) columns.push_back(column);
  return columns;
}

// A row that the table does not take, such as one with a damaged value, is passed over.
bool concernsTheFile(const PlatformError& error) {
  return meaningOf(error) != SQLiteFailure::other;
}

enum class Reading { ended, broken };

// Copies in the given order up to the end or the first row that cannot be read.
Result<Reading> copyRows(SQLiteDatabase& from, SQLiteStatement& insert, const std::string& query,
                         int columns) {
  const auto broken = [](const PlatformError& error) {
    return showsDamage(error) ? Result<Reading>(Reading::broken) : error;
  };
  auto rows = from.prepare(query);
  if (!rows) return broken(rows.error());
  while (true) {
    const auto step = rows->step();
    if (!step) return broken(step.error());
    if (*step == Step::done) return Reading::ended;
    for (int column = 0; column < columns; ++column) insert.bind(column + 1, *rows, column);
    const auto inserted = insert.step();
    insert.reset();
    if (!inserted && concernsTheFile(inserted.error())) return inserted.error();
  }
}

}  // namespace

Failure salvage(SQLiteDatabase& from, SQLiteDatabase& to, std::span<const SavedTable> tables) {
  for (const SavedTable& table : tables) {
    const auto columns = sharedColumns(from, to, table);
    if (!columns) return columns.error();
    if (columns->empty()) continue;
    const auto names = fmt::format("{}", fmt::join(*columns, ", "));
    const std::vector<std::string_view> marks(columns->size(), "?");
    auto insert = to.prepare(fmt::format("INSERT OR IGNORE INTO {}({}) VALUES({})", table.name,
                                         names, fmt::join(marks, ", ")));
    if (!insert) return insert.error();
    // A page that cannot be read hides the rows behind it; from the end they may be reached. By row
    // number, because an index may be what is damaged.
    for (const char* order : {"rowid", "rowid DESC"}) {
      const auto reading = copyRows(
          from, *insert,
          fmt::format("SELECT {} FROM {} NOT INDEXED ORDER BY {}", names, table.name, order),
          static_cast<int>(columns->size()));
      if (!reading) return reading.error();
      if (*reading == Reading::ended) break;
    }
  }
  return std::nullopt;
}

}  // namespace Varnel::Platform
