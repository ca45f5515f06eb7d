// SPDX-License-Identifier: MIT
#pragma once

#include <chrono>
#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

#include <Varnel/Platform/Generic/SQLiteStatement.h>
#include <Varnel/Platform/Values/Result.h>
#include <Varnel/Platform/Values/UniqueHandle.h>

struct sqlite3;

namespace Varnel::Platform {

/// A connection to an SQLite database file; destruction closes it.
///
///     auto database = SQLiteDatabase::open(path);
///     if (!database) return report(database.error());
///     auto statement = database->prepare("SELECT name FROM person WHERE age > ?");
///     …
///
/// One thread at a time. Statements must be gone before their database. An error has the domain
/// "SQLite", the library's extended result code, and its message.
class SQLiteDatabase final {
 public:
  enum class Access {
    readOnly,   ///< The file must exist and is never changed.
    readWrite,  ///< The file is created when missing.
  };

  /// Opens with the library's defaults and nothing else: the file is created when missing, locks
  /// are not waited for, and only the first statement shows whether it is a database.
  [[nodiscard]] static Result<SQLiteDatabase> open(const std::string& path);

  /// Opens for this kind of access.
  [[nodiscard]] static Result<SQLiteDatabase> open(const std::string& path, Access access);

  /// How long an operation waits for a lock that another connection holds; not at all by default.
  void setBusyTimeout(std::chrono::milliseconds timeout);

  /// Compiles one statement.
  [[nodiscard]] Result<SQLiteStatement> prepare(std::string_view sql);

  /// Runs statements, separated by ";", and ignores their rows. Returns the error, or none.
  [[nodiscard]] std::optional<PlatformError> execute(const std::string& sql);

  /// The number of rows that the last INSERT, UPDATE or DELETE touched.
  [[nodiscard]] std::int64_t changedRows() const;

  /// Whether the file has been renamed, replaced or removed since it was opened.
  [[nodiscard]] bool hasMoved() const;

 private:
  static void close(sqlite3* connection);
  static Result<SQLiteDatabase> opened(sqlite3* connection, int status);

  using Connection = UniqueHandle<sqlite3*, close>;
  explicit SQLiteDatabase(Connection connection) : connection_(std::move(connection)) {}

  Connection connection_;
};

}  // namespace Varnel::Platform
