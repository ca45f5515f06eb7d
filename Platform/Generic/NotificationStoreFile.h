// SPDX-License-Identifier: MIT
#pragma once

#include <filesystem>
#include <functional>
#include <optional>
#include <string>

#include <Varnel/Platform/SQLite/SQLiteDatabase.h>

namespace Varnel::Platform {

class SystemLog;

/// The database file of a notification store, for its user alone, opened on first use.
///
/// A damaged file is set aside (with ".damaged" behind its name) and a fresh one made; where no
/// file can be made, the database is in memory for the life of the object. Both are reported to the
/// system's log. A file that somebody else renamed or removed is made anew. While another process
/// keeps the file locked, work fails and can be tried again. One thread at a time; several
/// processes may share the file.
class NotificationStoreFile final {
 public:
  using Work = std::function<std::optional<PlatformError>(SQLiteDatabase&)>;

  /// The schema creates missing tables and fails when existing ones differ from it.
  NotificationStoreFile(std::filesystem::path file, std::string schema, SystemLog& systemLog);

  /// Does the work; true if it succeeded.
  bool read(const Work& work);
  /// Does the work as a whole or not at all, and alone among all processes.
  bool change(const Work& work);

 private:
  using Failure = std::optional<PlatformError>;  ///< None when there is a database to work with.

  [[nodiscard]] std::optional<PlatformError> attempt(const Work& work);
  [[nodiscard]] Failure open();
  [[nodiscard]] Failure ensureOpen();
  [[nodiscard]] Failure setAside();
  [[nodiscard]] Failure doWithout(const PlatformError& reason);
  void report(const std::string& what, const PlatformError& error) const;

  const std::filesystem::path file_;
  const std::string schema_;
  SystemLog& systemLog_;
  std::optional<SQLiteDatabase> database_;
};

}  // namespace Varnel::Platform
