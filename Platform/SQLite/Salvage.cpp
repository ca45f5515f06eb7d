// SPDX-License-Identifier: MIT
#include <Varnel/Platform/SQLite/Salvage.h>

#include <set>

#include <Varnel/Platform/SQLite/SQLiteDatabase.h>
#include <Varnel/Platform/SQLite/SQLiteFailure.h>
#include <fmt/format.h>
#include <fmt/ranges.h>

namespace Varnel::Platform {
namespace {

using Failure = std::optional<PlatformError>;
using Step = SQLiteStatement::Step;

// None where the table cannot be read at all.
std::set<std::string> columnsOf(SQLiteDatabase& database, const std::string& table) {
  std::set<std::string> columns;
  static_cast<void>(database.each(
      "SELECT name FROM pragma_table_info(?)",
      [&](SQLiteStatement& row) { columns.emplace(row.text(0).value_or("")); }, table));
  return columns;
}

// Those columns that both files have: the damaged one may be of another version.
std::vector<std::string> sharedColumns(SQLiteDatabase& from, SQLiteDatabase& to,
                                       const SavedTable& table) {
  const std::set<std::string> there = columnsOf(to, table.name);
  std::vector<std::string> columns;
  for (const std::string& column : columnsOf(from, table.name))
    if (there.contains(column) && column != table.ownNumber) columns.push_back(column);
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
  auto rows = from.prepare(query);
  if (!rows) return Reading::broken;
  while (true) {
    const auto step = rows->step();
    if (!step) return Reading::broken;
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
    if (columns.empty()) continue;
    const auto names = fmt::format("{}", fmt::join(columns, ", "));
    const std::vector<std::string_view> marks(columns.size(), "?");
    auto insert = to.prepare(fmt::format("INSERT OR IGNORE INTO {}({}) VALUES({})", table.name,
                                         names, fmt::join(marks, ", ")));
    if (!insert) return insert.error();
    // A page that cannot be read hides the rows behind it; from the end they may be reached. By row
    // number, because an index may be what is damaged.
    for (const char* order : {"rowid", "rowid DESC"}) {
      const auto reading = copyRows(
          from, *insert,
          fmt::format("SELECT {} FROM {} NOT INDEXED ORDER BY {}", names, table.name, order),
          static_cast<int>(columns.size()));
      if (!reading) return reading.error();
      if (*reading == Reading::ended) break;
    }
  }
  return std::nullopt;
}

}  // namespace Varnel::Platform
