// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Generic/SQLiteDatabase.h>

#include <sqlite3.h>

#include <Varnel/Platform/Generic/SQLiteError.h>

namespace Varnel::Platform {

PlatformError sqliteError(sqlite3* connection, int status) {
  const char* message = connection ? ::sqlite3_errmsg(connection) : ::sqlite3_errstr(status);
  const int code = connection ? ::sqlite3_extended_errcode(connection) : status;
  return PlatformError("SQLite", code,
                       {{std::string(localizedDescriptionKey), std::string(message)}});
}

void SQLiteDatabase::close(sqlite3* connection) {
  ::sqlite3_close(connection);
}

// The library hands out a connection even when it could not open the file.
Result<SQLiteDatabase> SQLiteDatabase::opened(sqlite3* connection, int status) {
  Connection owned(connection);
  if (status != SQLITE_OK) return sqliteError(connection, status);
  return SQLiteDatabase(std::move(owned));
}

Result<SQLiteDatabase> SQLiteDatabase::open(const std::string& path) {
  sqlite3* connection = nullptr;
  const int status = ::sqlite3_open(path.c_str(), &connection);
  return opened(connection, status);
}

Result<SQLiteDatabase> SQLiteDatabase::open(const std::string& path, Access access) {
  const int flags = access == Access::readOnly ? SQLITE_OPEN_READONLY
                                               : SQLITE_OPEN_READWRITE | SQLITE_OPEN_CREATE;
  sqlite3* connection = nullptr;
  const int status = ::sqlite3_open_v2(path.c_str(), &connection, flags, nullptr);
  return opened(connection, status);
}

void SQLiteDatabase::setBusyTimeout(std::chrono::milliseconds timeout) {
  ::sqlite3_busy_timeout(connection_.get(), static_cast<int>(timeout.count()));
}

Result<SQLiteStatement> SQLiteDatabase::prepare(std::string_view sql) {
  sqlite3_stmt* statement = nullptr;
  const int status = ::sqlite3_prepare_v2(connection_.get(), sql.data(),
                                          static_cast<int>(sql.size()), &statement, nullptr);
  if (status != SQLITE_OK) return sqliteError(connection_.get(), status);
  return SQLiteStatement(SQLiteStatement::Statement(statement));
}

std::optional<PlatformError> SQLiteDatabase::execute(const std::string& sql) {
  const int status = ::sqlite3_exec(connection_.get(), sql.c_str(), nullptr, nullptr, nullptr);
  if (status == SQLITE_OK) return std::nullopt;
  return sqliteError(connection_.get(), status);
}

std::int64_t SQLiteDatabase::changedRows() const {
  return ::sqlite3_changes64(connection_.get());
}

bool SQLiteDatabase::hasMoved() const {
  int moved = 0;
  ::sqlite3_file_control(connection_.get(), "main", SQLITE_FCNTL_HAS_MOVED, &moved);
  return moved != 0;
}

}  // namespace Varnel::Platform
