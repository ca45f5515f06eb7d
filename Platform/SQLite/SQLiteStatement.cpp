// SPDX-License-Identifier: MIT
#include <Varnel/Platform/SQLite/SQLiteStatement.h>

#include <sqlite3.h>

#include <cassert>

#include <Varnel/Platform/SQLite/SQLiteError.h>

namespace Varnel::Platform {
namespace {

void expectOK([[maybe_unused]] int status) {
  assert(status == SQLITE_OK);
}

}  // namespace

void SQLiteStatement::finalize(sqlite3_stmt* statement) {
  ::sqlite3_finalize(statement);
}

void SQLiteStatement::bind(int index, std::int64_t value) {
  expectOK(::sqlite3_bind_int64(statement_.get(), index, value));
}

// A null pointer would bind NULL, which an empty text is not.
void SQLiteStatement::bind(int index, std::string_view text) {
  expectOK(::sqlite3_bind_text64(statement_.get(), index, text.empty() ? "" : text.data(),
                                 text.size(), SQLITE_TRANSIENT, SQLITE_UTF8));
}

void SQLiteStatement::bind(int index, std::nullopt_t) {
  expectOK(::sqlite3_bind_null(statement_.get(), index));
}

// Not inline: where it is, GCC 12 sees numbers read that are not there.
void SQLiteStatement::bind(int index, const std::optional<std::int64_t>& value) {
  value ? bind(index, *value) : bind(index, std::nullopt);
}

void SQLiteStatement::bind(int index, SQLiteStatement& row, int column) {
  expectOK(::sqlite3_bind_value(statement_.get(), index,
                                ::sqlite3_column_value(row.statement_.get(), column)));
}

Result<SQLiteStatement::Step> SQLiteStatement::step() {
  const int status = ::sqlite3_step(statement_.get());
  if (status == SQLITE_ROW) return Step::row;
  if (status == SQLITE_DONE) return Step::done;
  return sqliteError(::sqlite3_db_handle(statement_.get()), status);
}

// The result repeats the failure that the last step has reported already.
void SQLiteStatement::reset() {
  ::sqlite3_reset(statement_.get());
}

std::optional<std::string_view> SQLiteStatement::text(int index) {
  const unsigned char* text = ::sqlite3_column_text(statement_.get(), index);
  if (!text) return std::nullopt;
  return reinterpret_cast<const char*>(text);
}

std::optional<std::int64_t> SQLiteStatement::integer(int index) {
  if (::sqlite3_column_type(statement_.get(), index) == SQLITE_NULL) return std::nullopt;
  return ::sqlite3_column_int64(statement_.get(), index);
}

}  // namespace Varnel::Platform
