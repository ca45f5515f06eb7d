// SPDX-License-Identifier: MIT
#include <orvane/StoredRows.h>

#include <chrono>
#include <functional>
#include <nlohmann/json.hpp>
#include <tuple>
#include <utility>
#include <vector>

#include <Varnel/Platform/SQLite/SQLiteDatabase.h>
#include <Varnel/Platform/SQLite/SQLiteFailure.h>
#include <orvane/JSONLine.h>

namespace Orvane {
namespace {

using Varnel::Platform::Result;
using Varnel::Platform::SQLiteDatabase;
using Varnel::Platform::SQLiteFailure;
using Varnel::Platform::SQLiteStatement;
using Failure = std::optional<Varnel::Platform::PlatformError>;
using nlohmann::ordered_json;

// By this table of the events a running process learns that it may send none any more.
constexpr const char* revocations = "state";

constexpr auto maxWait = std::chrono::seconds(1);

struct Column {
  std::string name;
  std::string type;
};

Result<SQLiteDatabase> open(const std::string& path) {
  auto database = SQLiteDatabase::open(path, SQLiteDatabase::Access::existing);
  if (database) database->setBusyTimeout(maxWait);
  return database;
}

// A name as it stands in a statement.
std::string quoted(const std::string& name) {
  std::string text = "\"";
  for (const char c : name) text += c == '"' ? std::string("\"\"") : std::string(1, c);
  return text + "\"";
}

// Without the library's own and the one that only counts how often the file was damaged.
Failure listTables(SQLiteDatabase& database, std::vector<std::string>& tables) {
  return database.each(
      "SELECT name FROM sqlite_master WHERE type = 'table' AND name NOT LIKE 'sqlite!_%' ESCAPE '!'"
      " AND name <> 'durable_file' ORDER BY rowid",
      [&](SQLiteStatement& row) { row.read(std::tie(tables.emplace_back())); });
}

Failure listColumns(SQLiteDatabase& database, const std::string& table,
                    std::vector<Column>& columns) {
  return database.each(
      "SELECT name, type FROM pragma_table_info(?)",
      [&](SQLiteStatement& row) {
        Column& column = columns.emplace_back();
        row.read(std::tie(column.name, column.type));
      },
      table);
}

Failure readTable(SQLiteDatabase& database, const std::string& table, ordered_json& rows) {
  std::vector<Column> columns;
  if (auto error = listColumns(database, table, columns)) return error;
  std::string names;
  for (const Column& column : columns) names += (names.empty() ? "" : ", ") + quoted(column.name);
  return database.each("SELECT " + names + " FROM " + quoted(table), [&](SQLiteStatement& row) {
    ordered_json object = ordered_json::object();
    int index = 0;
    for (const Column& column : columns) {
      ordered_json& value = object[column.name];
      if (column.type == "INTEGER") {
        if (const auto number = row.integer(index)) value = *number;
      } else if (const auto text = row.text(index)) {
        addText(object, column.name, std::string(*text));
      }
      ++index;
    }
    rows.push_back(std::move(object));
  });
}

}  // namespace

Result<std::int64_t> countRows(const std::string& path, const std::string& table) {
  auto database = open(path);
  if (!database) return database.error();
  std::int64_t count = 0;
  if (auto error = database->row("SELECT count(*) FROM " + quoted(table), std::tie(count)))
    return *error;
  return count;
}

Result<ordered_json> readRows(const std::string& path) {
  auto database = open(path);
  if (!database) return database.error();
  ordered_json tables = ordered_json::object();
  const auto error = database->transaction("BEGIN", [&](SQLiteDatabase&) -> Failure {
    std::vector<std::string> names;
    Failure failure = listTables(*database, names);
    for (const std::string& name : names)
      if (!failure) failure = readTable(*database, name, tables[name] = ordered_json::array());
    return failure;
  });
  if (error) return *error;
  return tables;
}

Wiping wipeRows(const std::string& path) {
  auto database = open(path);
  Failure error = database ? database->execute("PRAGMA secure_delete = ON") : database.error();
  if (!error)
    error = database->transaction("BEGIN IMMEDIATE", [](SQLiteDatabase& all) -> Failure {
      std::vector<std::string> names;
      Failure failure = listTables(all, names);
      for (const std::string& name : names)
        if (!failure && name != revocations) failure = all.execute("DELETE FROM " + quoted(name));
      return failure;
    });
  // Nobody can read the rows of a damaged file, nor has it open for long.
  if (error && meaningOf(*error) == SQLiteFailure::damaged) return {.error = {}, .isShared = false};
  if (error) return {.error = std::move(error), .isShared = false};
  // The log holds what was written earlier. It can go only where nobody else has the file open.
  static_cast<void>(database->execute("PRAGMA wal_checkpoint(TRUNCATE)"));
  std::string mode;
  error = database->row("PRAGMA journal_mode = DELETE", std::tie(mode));
  return {.error = {}, .isShared = error || mode == "wal"};
}

}  // namespace Orvane
