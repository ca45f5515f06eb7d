// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <optional>
#include <string_view>

#include <Varnel/Platform/Values/Result.h>
#include <Varnel/Platform/Values/UniqueHandle.h>

struct sqlite3_stmt;

namespace Varnel::Platform {

/// A compiled statement of an `SQLiteDatabase`; destruction finalises it.
///
///     statement.bind(1, 18);
///     while (true) {
///       auto row = statement.step();
///       if (!row) return report(row.error());
///       if (*row == SQLiteStatement::Step::done) break;
///       use(statement.text(0));
///     }
///
/// One thread at a time. A column's value lives until the next step or reset, or the end of the
/// statement.
class SQLiteStatement final {
 public:
  enum class Step { row, done };

  /// Gives the parameter at `index`, counted from 1, a value; text is copied. A wrong index is a
  /// programming error.
  void bind(int index, std::int64_t value);
  void bind(int index, std::string_view text);
  void bindNull(int index);
  /// Binds the column of another statement's row, whatever its type is.
  void bind(int index, SQLiteStatement& row, int column);

  /// Fetches the next row or runs the statement to its end.
  [[nodiscard]] Result<Step> step();

  /// Makes the statement ready to run once more. Parameters keep their values.
  void reset();

  /// The column at `index`, counted from 0, of the row just fetched. Text is whatever bytes the
  /// file holds up to the first zero, not always UTF-8. Absent for NULL and for a column that is
  /// not there.
  [[nodiscard]] std::optional<std::string_view> text(int index);
  [[nodiscard]] std::optional<std::int64_t> integer(int index);

 private:
  friend class SQLiteDatabase;

  static void finalize(sqlite3_stmt* statement);

  using Statement = UniqueHandle<sqlite3_stmt*, finalize>;
  explicit SQLiteStatement(Statement statement) : statement_(std::move(statement)) {}

  Statement statement_;
};

}  // namespace Varnel::Platform
