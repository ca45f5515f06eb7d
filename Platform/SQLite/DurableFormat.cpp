// SPDX-License-Identifier: MIT
#include <Varnel/Platform/SQLite/DurableFormat.h>

#include <algorithm>

#include <Varnel/Platform/SQLite/SQLiteDatabase.h>
#include <Varnel/Platform/SQLite/SQLiteFailure.h>
#include <fmt/format.h>

namespace Varnel::Platform {
namespace {

using Failure = std::optional<PlatformError>;

constexpr int minorsPerMajor = 1000;

// How often the file was damaged or lost. The number of the row is a name that no other file has;
// the first files had none, but the number 1.
constexpr const char* ownSchema =
    "CREATE TABLE durable_file(damages INTEGER NOT NULL);"
    "INSERT INTO durable_file(rowid, damages) VALUES(random(), 0);";

struct FoundFormat {
  std::int64_t applicationID = 0;
  FormatVersion version;
  bool isEmpty = false;
};

Result<FoundFormat> formatOf(SQLiteDatabase& database) {
  std::int64_t applicationID = 0;
  int version = 0;
  std::int64_t entries = 0;
  auto error = database.row("PRAGMA application_id", std::tie(applicationID));
  if (!error) error = database.row("PRAGMA user_version", std::tie(version));
  if (!error) error = database.row("SELECT count(*) FROM sqlite_master", std::tie(entries));
  if (error) return *error;
  return FoundFormat{.applicationID = applicationID,
                     .version = {version / minorsPerMajor, version % minorsPerMajor},
                     .isEmpty = applicationID == 0 && version == 0 && entries == 0};
}

bool canMigrate(const DurableFormat& format, FormatVersion version, Migrating migrating) {
  return migrating == Migrating::allowed && version < format.version &&
         std::any_of(format.migrations.begin(), format.migrations.end(),
                     [&](const Migration& migration) { return migration.from == version; });
}

// Such a table has a text of its own.
bool isAltered(const DurableFormat& format, const std::string& table) {
  return std::ranges::any_of(format.migrations, [&](const Migration& migration) {
    return migration.sql.find("ALTER TABLE " + table) != std::string::npos;
  });
}

// A file that calls itself one of this very version has its tables, and they are what they were
// made as. The library's own check of a file takes a damaged definition for meant.
Failure foreignTable(SQLiteDatabase& database, const DurableFormat& format) {
  for (const SavedTable& table : format.tables) {
    std::string definition;
    if (auto error = database.row("SELECT sql FROM sqlite_master WHERE type = 'table' AND name = ?",
                                  std::tie(definition), table.name))
      return error;
    const bool isOurs = format.schema.find(definition) != std::string::npos;
    if (definition.empty() || (!isOurs && !isAltered(format, table.name)))
      return fileError(SQLiteFailure::damaged,
                       fmt::format("there is no table {} of this format", table.name));
  }
  return std::nullopt;
}

Failure stamp(SQLiteDatabase& database, const DurableFormat& format) {
  return database.execute(
      fmt::format("PRAGMA application_id = {}; PRAGMA user_version = {}", format.applicationID,
                  format.version.major * minorsPerMajor + format.version.minor));
}

Failure migrate(SQLiteDatabase& database, const DurableFormat& format, FormatVersion version) {
  for (const Migration& migration : format.migrations) {
    if (migration.from < version || migration.from >= format.version) continue;
    if (auto error = database.execute(migration.sql)) return error;
  }
  return stamp(database, format);
}

Failure create(SQLiteDatabase& database, const DurableFormat& format) {
  auto error = database.execute(ownSchema);
  if (!error) error = database.execute(format.schema);
  return error ? error : stamp(database, format);
}

}  // namespace

Failure judgeFormat(SQLiteDatabase& database, const DurableFormat& format, Migrating migrating) {
  const auto found = formatOf(database);
  if (!found) return found.error();
  if (found->isEmpty) return std::nullopt;
  if (found->applicationID != format.applicationID)
    return fileError(SQLiteFailure::refused, "the file belongs to another application");
  const FormatVersion version = found->version;
  const auto named = fmt::format("the file's format is {}.{}", version.major, version.minor);
  if (version.major > format.version.major) return fileError(SQLiteFailure::newer, named);
  if (version.major < format.version.major && !canMigrate(format, version, migrating))
    return fileError(SQLiteFailure::older, named);
  return version == format.version ? foreignTable(database, format) : std::nullopt;
}

Failure applyFormat(SQLiteDatabase& database, const DurableFormat& format, Migrating migrating) {
  const auto apply = [&](SQLiteDatabase&) -> Failure {
    const auto found = formatOf(database);
    if (!found) return found.error();
    if (found->isEmpty) return create(database, format);
    if (canMigrate(format, found->version, migrating))
      return migrate(database, format, found->version);
    return std::nullopt;
  };
  const auto found = formatOf(database);
  if (!found) return found.error();
  if (!found->isEmpty && !canMigrate(format, found->version, migrating)) return std::nullopt;
  return database.transaction("BEGIN IMMEDIATE", apply);
}

}  // namespace Varnel::Platform
