// SPDX-License-Identifier: MIT
#pragma once

#include <filesystem>
#include <stdexcept>
#include <string>

#include <Varnel/Platform/SQLite/SQLiteDatabase.h>

namespace Varnel::Tests {

/// Runs SQL on a database file, which it makes when missing.
inline void runSQL(const std::filesystem::path& file, const std::string& sql) {
  using Platform::SQLiteDatabase;
  std::filesystem::create_directories(file.parent_path());
  auto database = SQLiteDatabase::open(file.string(), SQLiteDatabase::Access::readWrite);
  if (!database) throw std::runtime_error(database.error().description());
  if (const auto error = database->execute("PRAGMA synchronous = OFF;" + sql))
    throw std::runtime_error(error->description());
}

/// The table of downloads with all the columns that the system gives it.
inline const std::string& createQuarantineTable() {
  static const std::string sql =
      "CREATE TABLE LSQuarantineEvent (LSQuarantineEventIdentifier TEXT PRIMARY KEY,"
      " LSQuarantineTimeStamp REAL, LSQuarantineAgentBundleIdentifier TEXT,"
      " LSQuarantineAgentName TEXT, LSQuarantineDataURLString TEXT, LSQuarantineSenderName TEXT,"
      " LSQuarantineSenderAddress TEXT, LSQuarantineTypeNumber INTEGER,"
      " LSQuarantineOriginTitle TEXT, LSQuarantineOriginURLString TEXT,"
      " LSQuarantineOriginAlias BLOB);";
  return sql;
}

/// A row of that table; both are SQL expressions.
inline std::string insertDownload(const std::string& identifier, const std::string& dataURL) {
  return "INSERT INTO LSQuarantineEvent VALUES (" + identifier +
         ", 600000000.5, 'org.example.browser', 'Browser', " + dataURL +
         ", 'Ada', 'ada@example.org', 2, 'Downloads', 'https://example.org/', x'00');";
}

}  // namespace Varnel::Tests
