// SPDX-License-Identifier: MIT
#include <Varnel/Platform/SQLite/SQLiteDatabase.h>

#include <sqlite3.h>

#include <cerrno>

#include <Varnel/Platform/SQLite/LockDeadline.h>
#include <Varnel/Platform/SQLite/SQLiteError.h>
#include <Varnel/Platform/Values/PercentEncoding.h>

namespace Varnel::Platform {
namespace {

// A full disk shows itself in many calls, and only some of them are told apart by the library.
int codeOf(sqlite3* connection, int status) {
  const int code = connection ? ::sqlite3_extended_errcode(connection) : status;
  const int primary = code & 0xff;
  if (!connection || (primary != SQLITE_IOERR && primary != SQLITE_CANTOPEN)) return code;
  switch (::sqlite3_system_errno(connection)) {
    case ENOSPC:
    case EDQUOT:
      return SQLITE_FULL;
    case EROFS:
    case EACCES:
      return SQLITE_READONLY_DIRECTORY;
    default:
      return code;
  }
}

// The name of a file that is never to be locked, in the library's form of a URI.
std::string immutableName(const std::string& path) {
  std::string name = "file:";
  appendPercentEncoded(name, path, pathBytes);
  return name + "?immutable=1";
}

}  // namespace

PlatformError sqliteError(sqlite3* connection, int status) {
  const char* message = connection ? ::sqlite3_errmsg(connection) : ::sqlite3_errstr(status);
  return PlatformError("SQLite", codeOf(connection, status),
                       {{std::string(localizedDescriptionKey), std::string(message)}});
}

void SQLiteDatabase::close(sqlite3* connection) {
  ::sqlite3_close(connection);
}

// The library hands out a connection even when it could not open the file.
Result<SQLiteDatabase> SQLiteDatabase::opened(sqlite3* connection, int status) {
  Connection owned(connection);
  if (status != SQLITE_OK) return sqliteError(connection, status);
  // Views and triggers are programs that whoever made the file has written, and may never end.
  ::sqlite3_db_config(connection, SQLITE_DBCONFIG_ENABLE_VIEW, 0, nullptr);
  ::sqlite3_db_config(connection, SQLITE_DBCONFIG_ENABLE_TRIGGER, 0, nullptr);
  return SQLiteDatabase(std::move(owned));
}

Result<SQLiteDatabase> SQLiteDatabase::open(const std::string& path) {
  sqlite3* connection = nullptr;
  const int status = ::sqlite3_open(path.c_str(), &connection);
  return opened(connection, status);
}

Result<SQLiteDatabase> SQLiteDatabase::open(const std::string& path, Access access) {
  std::string name = path;
  int flags = SQLITE_OPEN_READONLY;
  switch (access) {
    case Access::readOnly:
      break;
    case Access::readWrite:
      flags = SQLITE_OPEN_READWRITE | SQLITE_OPEN_CREATE;
      break;
    case Access::existing:
      flags = SQLITE_OPEN_READWRITE | SQLITE_OPEN_NOFOLLOW;
      break;
    case Access::immutable:
      flags = SQLITE_OPEN_READONLY | SQLITE_OPEN_NOFOLLOW | SQLITE_OPEN_URI;
      name = immutableName(path);
      break;
  }
  sqlite3* connection = nullptr;
  const int status = ::sqlite3_open_v2(name.c_str(), &connection, flags, nullptr);
  auto database = opened(connection, status);
  if (database && access == Access::existing)
    ::sqlite3_db_config(connection, SQLITE_DBCONFIG_NO_CKPT_ON_CLOSE, 1, nullptr);
  return database;
}

void SQLiteDatabase::setBusyTimeout(std::chrono::milliseconds timeout) {
  ::sqlite3_busy_timeout(connection_.get(), static_cast<int>(timeout.count()));
}

void SQLiteDatabase::waitWithin(LockDeadline& deadline) {
  const auto pause = [](void* waiting, int) {
    return static_cast<LockDeadline*>(waiting)->pause() ? 1 : 0;
  };
  ::sqlite3_busy_handler(connection_.get(), pause, &deadline);
}

Result<SQLiteStatement> SQLiteDatabase::prepare(std::string_view sql) {
  sqlite3_stmt* statement = nullptr;
  const int status = ::sqlite3_prepare_v2(connection_.get(), sql.data(),
                                          static_cast<int>(sql.size()), &statement, nullptr);
  if (status != SQLITE_OK) return sqliteError(connection_.get(), status);
  return SQLiteStatement(SQLiteStatement::Statement(statement));
}

Result<SQLiteStatement*> SQLiteDatabase::cached(std::string_view sql) {
  if (const auto found = cached_.find(sql); found != cached_.end()) return &found->second;
  auto statement = prepare(sql);
  if (!statement) return statement.error();
  return &cached_.emplace(sql, std::move(*statement)).first->second;
}

// A statement that is not run to its end would hold locks.
std::optional<PlatformError> SQLiteDatabase::runToEnd(SQLiteStatement& statement,
                                                      const TakeRow& take) {
  struct Reset {
    SQLiteStatement& statement;
    ~Reset() { statement.reset(); }
  } const reset{statement};
  while (true) {
    const auto step = statement.step();
    if (!step) return step.error();
    if (*step == SQLiteStatement::Step::done) return std::nullopt;
    if (take) take(statement);
  }
}

std::optional<PlatformError> SQLiteDatabase::transaction(
    const char* begin, const std::function<std::optional<PlatformError>(SQLiteDatabase&)>& work) {
  if (auto error = execute(begin)) return error;
  // Also when the work throws. This fails if an error has already ended the transaction.
  struct Rollback {
    sqlite3* connection;
    ~Rollback() {
      if (connection) ::sqlite3_exec(connection, "ROLLBACK", nullptr, nullptr, nullptr);
    }
  } rollback{connection_.get()};
  auto error = work(*this);
  if (!error) error = execute("COMMIT");
  if (!error) rollback.connection = nullptr;
  return error;
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

bool SQLiteDatabase::isReadOnly() const {
  return ::sqlite3_db_readonly(connection_.get(), "main") != 0;
}

void SQLiteDatabase::countLoggedPages(int& pages) {
  const auto count = [](void* counted, sqlite3*, const char*, int length) {
    *static_cast<int*>(counted) = length;
    return SQLITE_OK;
  };
  ::sqlite3_wal_hook(connection_.get(), count, &pages);
}

}  // namespace Varnel::Platform
