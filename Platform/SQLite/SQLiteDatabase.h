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
///     auto error = database->run("INSERT INTO person(name, born) VALUES(?, ?)", name, date);
///     error = database->each("SELECT name FROM person WHERE born > ?", [&](SQLiteStatement& row) {
///       row.read(std::tie(names.emplace_back()));
///     }, date);
///     error = database->row("SELECT count(*), min(born) FROM person", std::tie(count, oldest));
///
/// Parameters are what `SQLiteStatement::bind` takes, results what its `read` gives. A file's views
/// cannot be used, and its triggers do nothing.
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

  using TakeRow = std::function<void(SQLiteStatement& row)>;

  /// The next three run one statement with these parameters to its end, and return the error, or
  /// none. It is compiled once, and kept as long as the connection.
  template <typename... Parameters>
  [[nodiscard]] std::optional<PlatformError> run(std::string_view sql,
                                                 const Parameters&... parameters) {
    return each(sql, nullptr, parameters...);
  }

  /// Hands each row to `take`, which must not run the same statement.
  template <typename... Parameters>
  [[nodiscard]] std::optional<PlatformError> each(std::string_view sql, const TakeRow& take,
                                                  const Parameters&... parameters) {
    const auto statement = cached(sql);
    if (!statement) return statement.error();
    int index = 0;
    ((*statement)->bind(++index, parameters), ...);
    return runToEnd(**statement, take);
  }

  /// Reads the only row into variables, which keep what they hold where there is none.
  template <typename... Values, typename... Parameters>
  [[nodiscard]] std::optional<PlatformError> row(std::string_view sql, std::tuple<Values&...> into,
                                                 const Parameters&... parameters) {
    return each(
        sql, [&](SQLiteStatement& row) { row.read(into); }, parameters...);
  }

  /// Does the work between BEGIN and COMMIT; when either or the work fails or throws, nothing is
  /// changed.
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
  [[nodiscard]] Result<SQLiteStatement*> cached(std::string_view sql);
  [[nodiscard]] static std::optional<PlatformError> runToEnd(SQLiteStatement& statement,
                                                             const TakeRow& take);

  Connection connection_;
  std::map<std::string, SQLiteStatement, std::less<>> cached_;
};

}  // namespace Varnel::Platform
