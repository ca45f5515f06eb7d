// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <optional>
#include <string>

#include <Varnel/Platform/SQLite/DurableFormat.h>
#include <Varnel/Platform/SQLite/SQLiteDatabase.h>
#include <Varnel/Platform/Values/Date.h>

namespace Tallyhouse {

/// An event in the spool.
struct SpooledEvent final {
  /// Made of the event's date and UUID, so that it grows with time, differs between files, and
  /// tells an insertion that is repeated.
  std::int64_t id = 0;
  std::string uuid;
  Varnel::Platform::Date date;
  std::string hit;
  int refusals = 0;        ///< How often the server would not have it. 0: it waits in line.
  std::int64_t epoch = 0;  ///< In which it was recorded. Not kept in the file.
};

/// The file that the processes of a product share: events by their number, and one row of state.
///
/// The epoch is the time of the last refusal of consent, 0 if there was none. What was recorded in
/// an earlier epoch must not come into the file any more.
[[nodiscard]] const Varnel::Platform::DurableFormat& spoolFormat();

/// Runs a statement with these parameters to its end.
template <typename... Values>
[[nodiscard]] std::optional<Varnel::Platform::PlatformError> run(
    Varnel::Platform::SQLiteDatabase& database, const char* sql, const Values&... values) {
  auto statement = database.cached(sql);
  if (!statement) return statement.error();
  int index = 0;
  (statement.value()->bind(++index, values), ...);
  const auto step = statement.value()->step();
  statement.value()->reset();
  if (!step) return step.error();
  return std::nullopt;
}

/// Hands each row of a query to `take`, until that answers false.
template <typename Take, typename... Values>
[[nodiscard]] std::optional<Varnel::Platform::PlatformError> query(
    Varnel::Platform::SQLiteDatabase& database, const char* sql, Take take,
    const Values&... values) {
  using Step = Varnel::Platform::SQLiteStatement::Step;
  auto statement = database.cached(sql);
  if (!statement) return statement.error();
  int index = 0;
  (statement.value()->bind(++index, values), ...);
  std::optional<Varnel::Platform::PlatformError> error;
  for (bool wantsMore = true; wantsMore;) {
    const auto step = statement.value()->step();
    if (!step) error = step.error();
    wantsMore = step && *step == Step::row && take(*statement.value());
  }
  statement.value()->reset();
  return error;
}

}  // namespace Tallyhouse
