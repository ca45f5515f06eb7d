// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <tuple>
#include <type_traits>

#include <Varnel/Platform/Values/Date.h>
#include <Varnel/Platform/Values/Result.h>
#include <Varnel/Platform/Values/UniqueHandle.h>

struct sqlite3_stmt;

namespace Varnel::Platform {

/// A compiled statement of an `SQLiteDatabase`; destruction finalises it. Most statements are run
/// by the database itself, whose `each` hands out the statement as the row that it stands on.
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

  /// Gives the parameter at `index`, counted from 1, a value; text is copied, a date becomes a
  /// number, and what is absent NULL. A wrong index is a programming error.
  void bind(int index, std::int64_t value);
  void bind(int index, std::string_view text);
  void bind(int index, Date date) { bind(index, std::int64_t{date.time_since_epoch().count()}); }
  void bind(int index, std::nullopt_t null);
  void bind(int index, const std::optional<std::int64_t>& value);
  template <typename Value>
  void bind(int index, const std::optional<Value>& value) {
    value ? bind(index, *value) : bind(index, std::nullopt);
  }
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

  /// Reads the row's columns from the first one on: numbers, `std::string`, `Date`, and optionals
  /// of them. NULL empties an optional, and leaves another variable as it is.
  template <typename... Values>
  void read(std::tuple<Values&...> into) {
    int index = 0;
    std::apply([&](auto&... values) { (read(index++, values), ...); }, into);
  }

 private:
  friend class SQLiteDatabase;

  template <typename Value>
  void read(int index, Value& value) {
    std::optional<Value> found;
    read(index, found);
    if (found) value = *std::move(found);
  }
  template <typename Value>
  void read(int index, std::optional<Value>& value) {
    value.reset();
    if constexpr (std::is_same_v<Value, std::string>) {
      if (const auto found = text(index)) value.emplace(*found);
    } else if constexpr (std::is_same_v<Value, Date>) {
      if (const auto found = integer(index)) value.emplace(Date::duration(*found));
    } else if (const auto found = integer(index)) {
      value = static_cast<Value>(*found);
    }
  }

  static void finalize(sqlite3_stmt* statement);

  using Statement = UniqueHandle<sqlite3_stmt*, finalize>;
  explicit SQLiteStatement(Statement statement) : statement_(std::move(statement)) {}

  Statement statement_;
};

}  // namespace Varnel::Platform
