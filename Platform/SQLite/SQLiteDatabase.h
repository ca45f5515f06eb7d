// SPDX-License-Identifier: MIT
#pragma once

#include <chrono>
#include <cstdint>
#include <functional>
#include <map>
#include <optional>
#include <string>
#include <string_view>

#include <Varnel/Platform/SQLite/SQLiteStatement.h>
#include <Varnel/Platform/Values/Result.h>
#include <Varnel/Platform/Values/UniqueHandle.h>

struct sqlite3;

namespace Varnel::Platform {

class LockDeadline;

/// A connection to an SQLite database file; destruction closes it.
///
///     auto database = SQLiteDatabase::open(path);
///     if (!database) return report(database.error());
///     auto statement = database->prepare("SELECT name FROM person WHERE age > ?");
///     …
///
/// One thread at a time. Statements must be gone before their database. An error has the domain
/// "SQLite", the library's extended result code, and its message; `meaningOf` tells what to make of
/// it.
class SQLiteDatabase final {
 public:
  enum class Access {
    readOnly,   ///< The file must exist and is never changed.
    readWrite,  ///< The file is created when missing.
    existing,   ///< The file must exist, and no link is followed. It is only read where it cannot
                ///< be written. Its journal is never removed, which would be done by name.
    immutable   ///< The file is read without locks or journal: nobody can change it.
  };

  /// Opens with the library's defaults and nothing else: the file is created when missing, locks
  /// are not waited for, and only the first statement shows whether it is a database.
  [[nodiscard]] static Result<SQLiteDatabase> open(const std::string& path);

  /// Opens for this kind of access.
  [[nodiscard]] static Result<SQLiteDatabase> open(const std::string& path, Access access);

  /// How long an operation waits for a lock that another connection holds; not at all by default.
  void setBusyTimeout(std::chrono::milliseconds timeout);
  /// The same, with all waits of several operations together; the deadline outlives the connection.
  void waitWithin(LockDeadline& deadline);

  /// Compiles one statement.
  [[nodiscard]] Result<SQLiteStatement> prepare(std::string_view sql);

  /// The statement, compiled once and kept as long as the connection, ready to run.
  [[nodiscard]] Result<SQLiteStatement*> cached(std::string_view sql);

  /// Ends what kept statements have begun and not finished: it would hold locks.
  void finishCached();

  /// The first column of the first row; absent for NULL and where there is no row.
  [[nodiscard]] Result<std::optional<std::int64_t>> integer(std::string_view sql);

  /// Does the work between BEGIN and COMMIT; when either or the work fails, nothing is changed.
  [[nodiscard]] std::optional<PlatformError> transaction(
      const char* begin, const std::function<std::optional<PlatformError>(SQLiteDatabase&)>& work);

  /// Runs statements, separated by ";", and ignores their rows. Returns the error, or none.
  [[nodiscard]] std::optional<PlatformError> execute(const std::string& sql);

  /// The number of rows that the last INSERT, UPDATE or DELETE touched.
  [[nodiscard]] std::int64_t changedRows() const;

  /// Whether the file has been renamed, replaced or removed since it was opened.
  [[nodiscard]] bool hasMoved() const;

  /// Whether the file can only be read.
  [[nodiscard]] bool isReadOnly() const;

  /// From now on keeps in `pages` how long the write-ahead log is, and leaves it to the caller to
  /// move it into the file. `pages` outlives the connection.
  void countLoggedPages(int& pages);

 private:
  static void close(sqlite3* connection);
  static Result<SQLiteDatabase> opened(sqlite3* connection, int status);

  using Connection = UniqueHandle<sqlite3*, close>;
  explicit SQLiteDatabase(Connection connection) : connection_(std::move(connection)) {}

  Connection connection_;
  std::map<std::string, SQLiteStatement, std::less<>> cached_;
};

}  // namespace Varnel::Platform
